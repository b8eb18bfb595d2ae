#include "Tests/Fixtures/FixtureScript.h"

#include "Main/AudioEngineController/Effects/VST/Interface/VSTInterface.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstring>
#include <map>
#include <memory>
#include <optional>
#include <thread>

#ifdef _WIN32
#define FIXTURE_EXPORT extern "C" __declspec(dllexport)
#else
#define FIXTURE_EXPORT extern "C" __attribute__((visibility("default")))
#endif

namespace {

namespace vst = VstPublished;

/// What stands above the 32 bits of the flags, where other compilers leave what was in memory before.
const auto kFlagsPadding = static_cast<VstIntPtr>(0x5A5A5A5A00000000);
/// What the numbers of a closed effect read as.
const auto kSpoiled = static_cast<std::int32_t>(0xDDDDDDDD);
const int kOpcodes = 128; ///< those from here on are no stages
/// The most bytes of a chunk that a trace shows.
const VstIntPtr kShownBytes = 64;

// Constant, since static constructors read them.

constexpr std::pair<int, const char *> kStages[] = {{effOpen, "open"},
                                                    {effClose, "close"},
                                                    {effGetParamName, "get-param-name"},
                                                    {effMainsChanged, "mains-changed"},
                                                    {vst::effEditIdle, "edit-idle"},
                                                    {effGetChunk, "get-chunk"},
                                                    {effSetChunk, "set-chunk"},
                                                    {effGetPlugCategory, "get-plug-category"},
                                                    {effSetSpeakerArrangement, "set-speaker-arrangement"},
                                                    {effGetEffectName, "get-effect-name"},
                                                    {effGetVendorString, "get-vendor-string"},
                                                    {vst::effGetParameterProperties, "get-param-properties"},
                                                    {effShellGetNextPlugin, "shell-next"}};
constexpr int kWithPointer[] = {effGetParamName,    effGetChunk,
                                effSetChunk,        effGetEffectName,
                                effGetVendorString, effShellGetNextPlugin,
                                effEditGetRect,     effGetProgramName,
                                effCanDo,           vst::effGetParameterProperties};

using Field = decltype(&AEffect::numInputs);
/// The numbers of an effect, under the keys that set them.
constexpr std::pair<const char *, Field> kFields[] = {
    {"magic", &AEffect::magic},          {"inputs", &AEffect::numInputs},
    {"outputs", &AEffect::numOutputs},   {"id", &AEffect::uniqueID},
    {"latency", &AEffect::initialDelay}, {"stated-parameters", &AEffect::numParams},
    {"programs", &AEffect::numPrograms}};

/// The stage at which a dispatcher opcode is reached.
std::string stageOf(int opcode)
{
    for (const auto &[named, stage] : kStages)
        if (opcode == named)
            return stage;
    return "opcode-" + std::to_string(opcode);
}

const FixtureScript &script()
{
    static const FixtureScript script = [] {
        std::string stages = "static-constructor entry get-parameter set-parameter process static-destructor";
        for (int opcode = 0; opcode < kOpcodes; ++opcode)
            stages += ' ' + stageOf(opcode);
        std::string keys = "name vendor category flags parameter chunk editor set";
        for (const auto &[key, field] : kFields)
            keys += ' ' + std::string(key);
        return FixtureScript({"child", true, keys, "after-children", stages});
    }();
    return script;
}

/// What comes after the listed children: "endless", "repeat" or nothing.
std::string afterChildren() { return script().text("after-children", 0, {}); }
bool isShell() { return script().subjects.size() > 1 || !afterChildren().empty(); }

/// "TYPE(SPEAKERS…)".
std::string arrangementText(const void *pointer)
{
    const auto *arrangement = static_cast<const VstSpeakerArrangement *>(pointer);
    std::string text;
    for (int index = 0; arrangement && index < arrangement->numChannels; ++index)
        text += (index ? " " : "") + std::to_string(arrangement->speakers[index].type);
    return arrangement ? std::to_string(arrangement->type) + '(' + text + ')' : "null";
}

/// What the trace tells about a call of the dispatcher; empty where all is zero.
std::string detailOf(int opcode, int index, VstIntPtr value, const void *pointer, float opt)
{
    if (opcode == effSetSampleRate)
        return textOf(opt);
    if (opcode == effSetSpeakerArrangement)
        return arrangementText(reinterpret_cast<const void *>(value)) + " -> " + arrangementText(pointer);
    if (index == 0 && value == 0)
        return {};
    std::string detail = std::to_string(index) + " " + std::to_string(value);
    if (opcode == effSetChunk)
        detail.append(" ").append(static_cast<const char *>(pointer),
                                  static_cast<std::size_t>(std::clamp<VstIntPtr>(value, 0, kShownBytes)));
    return detail;
}

/// One effect that the module handed out. It stays in memory when it is closed, so that a call after that is
/// found out.
class Effect {
public:
    Effect(const FixtureSubject &subject, audioMasterCallback host)
        : m_subject(subject)
        , m_host(host)
        , m_name(script().text("name", subject.place, subject.name))
        , m_parameters(script().all("parameter", subject.place))
    {
        if (has("chunk"))
            m_chunk = script().text("chunk", subject.place, {});
        for (const FixtureScript::Words &parameter : m_parameters)
            m_values.push_back(parameter.size() > 1 ? floatOf(parameter[1]) : 0);
        effect.dispatcher = [](AEffect *self, int opcode, int index, VstIntPtr value, void *pointer,
                               float opt) { return of(self).dispatch(opcode, index, value, pointer, opt); };
        effect.process = effect.processReplacing = processBlock;
        effect.processDoubleReplacing = [](AEffect *, double **, double **, int) {};
        effect.setParameter = setParameter;
        effect.getParameter = getParameter;
        effect.object = this;
        effect.magic = kEffectMagic;
        effect.numPrograms = effect.version = 1;
        effect.numInputs = effect.numOutputs = 2;
        effect.numParams = static_cast<int>(m_parameters.size());
        effect.uniqueID = subject.number ? subject.number : 1000;
        for (const auto &[key, field] : kFields)
            effect.*field = number(key, effect.*field);
        const int usualFlags = effFlagsCanReplacing | (m_chunk ? effFlagsProgramChunks : 0) |
                               (has("editor") ? effFlagsHasEditor : 0);
        effect.flags = kFlagsPadding | static_cast<std::uint32_t>(number("flags", usualFlags));
        askHost("entry");
    }
    /// Threads that nobody stopped outlive the effect, as in a plug-in that nobody closed: they die when the
    /// module is unmapped under them.
    ~Effect()
    {
        for (std::thread &thread : m_threads)
            thread.detach();
    }
    Effect(const Effect &) = delete;
    Effect &operator=(const Effect &) = delete;

    /// Ends the effect's threads and spoils what the host must not read any more.
    void close()
    {
        *m_stopping = true;
        for (std::thread &thread : m_threads)
            thread.join();
        m_threads.clear();
        isClosed = true;
        for (const auto &[key, field] : kFields)
            effect.*field = kSpoiled;
    }

    AEffect effect = {};
    bool isClosed = false;

private:
    static Effect &of(AEffect *effect)
    {
        if (!effect)
            reportMisuse("a call without an effect");
        auto &self = *static_cast<Effect *>(effect->object);
        if (self.isClosed)
            reportMisuse("'" + self.m_subject.name + "' is called after it was closed");
        return self;
    }

    static void setParameter(AEffect *effect, int index, float value)
    {
        Effect &self = of(effect);
        if (!self.hasParameter(index))
            return;
        self.reach("set-parameter", std::to_string(index) + " " + textOf(value));
        self.m_values[static_cast<std::size_t>(index)] = value;
    }

    static float getParameter(AEffect *effect, int index)
    {
        Effect &self = of(effect);
        if (!self.hasParameter(index))
            return 0;
        self.reach("get-parameter", std::to_string(index));
        return self.m_values[static_cast<std::size_t>(index)];
    }

    /// Writes to every sample of every stated channel, so that a host without room for it is found out.
    static void processBlock(AEffect *effect, float **inputs, float **outputs, int frames)
    {
        const int count = effect->numOutputs; // the stage may change it
        of(effect).reach("process", std::to_string(frames));
        for (int channel = 0; channel < count; ++channel)
            for (int frame = 0; frame < frames; ++frame)
                outputs[channel][frame] += channel < effect->numInputs ? inputs[channel][frame] : 1.0f;
    }

    bool has(const char *key) const { return script().has(key, m_subject.place); }
    std::int32_t number(const char *key, std::int32_t usual) const
    {
        return script().number(key, m_subject.place, usual);
    }
    bool hasParameter(int index) const
    {
        return index >= 0 && static_cast<std::size_t>(index) < m_parameters.size();
    }

    void reach(const std::string &stage, const std::string &detail)
    {
        script().reach(stage, m_subject, detail);
        for (const FixtureScript::Words &words : script().all("set", m_subject.place))
            for (const auto &[key, field] : kFields)
                if (words.at(0) == stage && words.at(1) == key)
                    effect.*field = numberOf(words.at(2));
        askHost(stage);
    }

    /// Makes the host calls that the script has for a stage.
    void askHost(const std::string &stage)
    {
        for (const FixtureScript::Words &words : script().all("ask-host")) {
            const auto has = [&](const char *option) {
                return std::find(words.begin(), words.end(), option) != words.end();
            };
            const auto after = [&](const char *option) {
                return has(option) ? *(std::find(words.begin(), words.end() - 1, option) + 1) : "0";
            };
            if (words[0] != stage)
                continue;
            const auto ask = [this, opcode = numberOf(words.at(1)), index = numberOf(after("index")),
                              value = numberOf(after("value")), opt = floatOf(after("opt"))] {
                return m_host(&effect, opcode, index, value, nullptr, opt);
            };
            script().note("host-" + words[1], m_subject, std::to_string(ask()));
            if (has("until-close"))
                m_threads.emplace_back([stopping = m_stopping, ask] {
                    for (; !*stopping; std::this_thread::sleep_for(std::chrono::milliseconds(1)))
                        ask();
                });
        }
    }

    VstIntPtr dispatch(int opcode, int index, VstIntPtr value, void *pointer, float opt)
    {
        const bool asksParameter = opcode == effGetParamName || opcode == vst::effGetParameterProperties;
        const bool asksChild = opcode == effShellGetNextPlugin;
        if (!pointer &&
            std::find(std::begin(kWithPointer), std::end(kWithPointer), opcode) != std::end(kWithPointer))
            reportMisuse(stageOf(opcode) + " without a pointer");
        if (opcode == effSetChunk && value < 0)
            reportMisuse("set-chunk with a negative size");
        if (asksChild)
            return nextChild(pointer);
        if (asksParameter && !hasParameter(index))
            return 0;
        reach(stageOf(opcode), detailOf(opcode, index, value, pointer, opt));
        return answer(stageOf(opcode), m_subject, handle(opcode, index, value, pointer));
    }

    static VstIntPtr answer(const std::string &stage, const FixtureSubject &subject, VstIntPtr usual)
    {
        const std::string answer = script().answer(stage, subject);
        return answer.empty() ? usual : numberOf(answer);
    }

    VstIntPtr handle(int opcode, int index, VstIntPtr value, void *pointer)
    {
        switch (opcode) {
        case effClose:
            close();
            return 0;
        case effGetParamName:
            return fill(*static_cast<char(*)[128]>(pointer),
                        m_parameters[static_cast<std::size_t>(index)].at(0));
        case effGetChunk:
            if (m_chunk)
                *static_cast<const void **>(pointer) = m_chunk->data();
            return m_chunk ? static_cast<VstIntPtr>(m_chunk->size()) : 0;
        case effSetChunk:
            m_chunk = std::string(static_cast<const char *>(pointer), static_cast<std::size_t>(value));
            return 0;
        case effGetPlugCategory:
            return number("category", m_subject.place == 0 && isShell() ? kPlugCategShell : kPlugCategEffect);
        case effSetSpeakerArrangement:
            return 1;
        case effEditGetRect:
            *static_cast<ERect **>(pointer) = has("editor") ? &m_editor : nullptr;
            return has("editor") ? 1 : 0;
        case effGetEffectName:
            return fill(*static_cast<char(*)[1024]>(pointer), m_name);
        case effGetVendorString:
            return fill(*static_cast<char(*)[256]>(pointer),
                        script().text("vendor", m_subject.place, "Fixture Works"));
        case vst::effGetParameterProperties:
            return properties(m_parameters[static_cast<std::size_t>(index)], pointer);
        default:
            return 0;
        }
    }

    static VstIntPtr properties(const FixtureScript::Words &parameter, void *pointer)
    {
        if (parameter.size() < 3)
            return 0;
        auto &target = *static_cast<vst::VstParameterProperties *>(pointer);
        target = {};
        fill(target.label, parameter[2]);
        return fill(target.shortLabel, parameter[2]);
    }

    /// What comes after the listed children is not in the trace and no stage: a host that never stops asking
    /// would fill the disk.
    VstIntPtr nextChild(void *pointer)
    {
        const auto &subjects = script().subjects;
        const std::size_t count = subjects.size() - 1, place = m_listed++;
        const auto madeUp = static_cast<std::int32_t>(1000000 + place);
        FixtureSubject child = m_subject;
        if (place < count) {
            script().reach("shell-next", subjects[1 + place]); // a fault here leaves no copy behind
            child = subjects[1 + place];
        } else if (afterChildren() == "repeat")
            child = subjects[1 + place % count];
        else if (afterChildren() == "endless")
            child = {"Endless " + std::to_string(madeUp), madeUp};
        else
            script().reach("shell-next", child, "end");
        fill(*static_cast<char(*)[1024]>(pointer), child.name);
        return answer("shell-next", child, child.number);
    }

    FixtureSubject m_subject;
    audioMasterCallback m_host;
    std::string m_name;
    std::vector<FixtureScript::Words> m_parameters;
    std::vector<float> m_values;
    std::optional<std::string> m_chunk;
    ERect m_editor = {0, 0, 200, 300}; ///< from the top to the right
    std::size_t m_listed = 0;          ///< children listed so far
    std::shared_ptr<std::atomic<bool>> m_stopping = std::make_shared<std::atomic<bool>>(false);
    std::vector<std::thread> m_threads;
};

/// What the module handed out, for the module's life.
std::vector<std::unique_ptr<Effect>> &handedOut()
{
    static std::vector<std::unique_ptr<Effect>> effects;
    return effects;
}

/// Runs the script's first and last stage with the library's own start-up and shutdown code.
struct ModuleLife {
    ModuleLife()
    {
        handedOut(); // makes the list, so that it is still there at the end
        script().reach("static-constructor");
    }
    ~ModuleLife()
    {
        const auto open = std::count_if(handedOut().begin(), handedOut().end(),
                                        [](const auto &effect) { return !effect->isClosed; });
        script().reach("static-destructor", {}, open ? std::to_string(open) + " open" : "");
    }
} moduleLife;

/// A shell asks the host which of its children is wanted, as all do, without an effect; 0 is the shell
/// itself.
std::optional<FixtureSubject> wantedSubject(audioMasterCallback host)
{
    const auto id =
        isShell() ? static_cast<std::int32_t>(host(nullptr, audioMasterCurrentId, 0, 0, nullptr, 0)) : 0;
    for (const FixtureSubject &subject : script().subjects)
        if (subject.number == id)
            return subject;
    if (afterChildren() == "endless") // of no subject in the script
        return FixtureSubject{"Endless " + std::to_string(id), id, script().subjects.size()};
    script().note("entry", {}, std::to_string(id) + " unknown");
    return std::nullopt;
}

AEffect *enter(audioMasterCallback host)
{
    if (!host)
        reportMisuse("the entry is called without a callback");
    const std::optional<FixtureSubject> subject = wantedSubject(host);
    if (!subject)
        return nullptr;
    script().reach("entry", *subject, subject->number ? std::to_string(subject->number) : "");
    handedOut().push_back(std::make_unique<Effect>(*subject, host));
    const std::string answer = script().answer("entry", *subject);
    if (answer.empty())
        return &handedOut().back()->effect;
    handedOut().back()->close();
    if (answer == "same")
        return &handedOut().front()->effect;
    return answer == "null" ? nullptr : reinterpret_cast<AEffect *>(16); // "no-memory"
}

} // namespace

// FIXTURE_ENTRIES: 1 exports VSTPluginMain, 2 main, 3 both.
#if FIXTURE_ENTRIES & 1
FIXTURE_EXPORT AEffect *VSTPluginMain(audioMasterCallback host) { return enter(host); }
#endif
#if FIXTURE_ENTRIES & 2
// C++ has rules for a function of this name, so only its symbol has it.
FIXTURE_EXPORT AEffect *olderEntry(audioMasterCallback host) __asm__("main");

AEffect *olderEntry(audioMasterCallback host) { return FIXTURE_ENTRIES == 3 ? nullptr : enter(host); }
#endif
