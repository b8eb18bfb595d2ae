#include "Tests/Fixtures/VST2/ScriptedEffect.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstring>
#include <memory>
#include <optional>
#include <thread>
#include <utility>

namespace {

/// What stands above the 32 bits of the flags, where other compilers leave what was in memory before.
const auto kFlagsPadding = static_cast<VstIntPtr>(0x5A5A5A5A00000000);
/// What the numbers of a closed effect read as.
const auto kSpoiled = static_cast<std::int32_t>(0xDDDDDDDD);

/// A text that fills the buffer gets no terminator; what lies behind a shorter one is left as it was.
void fill(void *buffer, std::size_t size, const std::string &text, bool terminate = true)
{
    std::memcpy(buffer, text.data(), std::min(size, text.size()));
    if (terminate && text.size() < size)
        static_cast<char *>(buffer)[text.size()] = '\0';
}

/// The host call that this thread is nesting, while it waits for the host to call back.
thread_local const HostCall *nestedCall = nullptr;
thread_local int nestedDepth = 0; ///< the calls that are still to be made

/// A thread that does the same again and again until it is stopped. One that was not outlives this object, as
/// in a plug-in that nobody closed: it dies when the module is unmapped under it.
class RepeatingThread {
public:
    template <typename Step>
    explicit RepeatingThread(Step step)
        : m_thread([stopping = m_stopping, step] {
            for (; !*stopping; std::this_thread::sleep_for(std::chrono::milliseconds(1)))
                step();
        })
    {}
    RepeatingThread(RepeatingThread &&) = default;
    ~RepeatingThread()
    {
        if (m_thread.joinable())
            m_thread.detach();
    }
    void stop()
    {
        *m_stopping = true;
        if (m_thread.joinable())
            m_thread.join();
    }

private:
    std::shared_ptr<std::atomic<bool>> m_stopping = std::make_shared<std::atomic<bool>>(false);
    std::thread m_thread;
};

/// One effect that the module handed out. It stays in memory when it is closed, so that a call after that is
/// found out.
class Effect {
public:
    Effect(const FixtureSubject &subject, audioMasterCallback host, bool isOfSecondMain)
        : m_subject(subject)
        , m_host(host)
        , m_name(script().text("name", subject.place, subject.name) + (isOfSecondMain ? " by main" : ""))
        , m_parameters(script().all("parameter", subject.place))
    {
        if (script().has("chunk", subject.place))
            m_chunk = script().text("chunk", subject.place, {});
        for (const FixtureScript::Words &parameter : m_parameters)
            m_values.push_back(parameter.size() > 1 ? floatOf(parameter[1]) : 0);
        const int usualFlags = effFlagsCanReplacing | (m_chunk ? effFlagsProgramChunks : 0) |
                               (script().has("editor", subject.place) ? effFlagsHasEditor : 0);
        effect.magic = number("magic", kEffectMagic);
        effect.dispatcher = [](AEffect *self, int opcode, int index, VstIntPtr value, void *pointer,
                               float opt) { return of(self).dispatch(opcode, index, value, pointer, opt); };
        effect.process = effect.processReplacing = processBlock;
        effect.processDoubleReplacing = [](AEffect *, double **, double **, int) {};
        effect.setParameter = setParameter;
        effect.getParameter = getParameter;
        effect.numPrograms = effect.version = 1;
        effect.numParams = number("stated-parameters", static_cast<int>(m_parameters.size()));
        effect.numInputs = number("inputs", 2);
        effect.numOutputs = number("outputs", 2);
        effect.flags = kFlagsPadding | static_cast<std::uint32_t>(number("flags", usualFlags));
        effect.object = this;
        const int id = number("id", subject.number ? subject.number : 1000);
        effect.uniqueID = isOfSecondMain ? id + 1 : id;
        if (script().has("own-thread", subject.place))
            m_threads.emplace_back([] {});
    }
    Effect(const Effect &) = delete;
    Effect &operator=(const Effect &) = delete;

    /// Makes the host calls that the script has for a stage.
    void askHost(const std::string &stage)
    {
        for (const FixtureScript::Words &words : script().all("ask-host")) {
            const HostCall call(words);
            if (words[0] != stage)
                continue;
            if (call.fromThread)
                std::thread([&] { askAtDepth(call, call.depth); }).join();
            else
                askAtDepth(call, call.depth);
            if (call.untilClose)
                m_threads.emplace_back([this, call] { ask(call); });
        }
    }

    /// Ends the effect's threads and spoils what the host must not read any more.
    void close()
    {
        for (RepeatingThread &thread : m_threads)
            thread.stop();
        isClosed = true;
        effect.magic = effect.numPrograms = effect.numParams = effect.numInputs = kSpoiled;
        effect.numOutputs = effect.initialDelay = effect.uniqueID = kSpoiled;
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
        for (const FixtureScript::Words &words : script().all("new-outputs", m_subject.place))
            if (words[0] == stage)
                effect.numOutputs = numberOf(words.at(1));
        askHost(stage);
    }

    VstIntPtr dispatch(int opcode, int index, VstIntPtr value, void *pointer, float opt)
    {
        const bool asksParameter =
            opcode == effGetParamName || opcode == VstPublished::effGetParameterProperties;
        if (needsPointer(opcode) && !pointer)
            reportMisuse(stageOf(opcode) + " without a pointer");
        if (opcode == effSetChunk && value < 0)
            reportMisuse("set-chunk with a negative size");
        if (asksParameter && !hasParameter(index))
            return 0;
        if (opcode == effShellGetNextPlugin)
            return nextChild(pointer);
        // Taken first: a fault that this stage commits ends the nesting.
        const HostCall *call =
            opcode == VstPublished::effEditIdle ? std::exchange(nestedCall, nullptr) : nullptr;
        const int depth = nestedDepth;
        reach(stageOf(opcode), detailOf(opcode, index, value, pointer, opt));
        if (call)
            askAtDepth(*call, depth);
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
            fill(pointer, 128, m_parameters[static_cast<std::size_t>(index)].at(0));
            return 0;
        case effGetChunk:
            if (m_chunk)
                *static_cast<const void **>(pointer) =
                    script().has("null-chunk", m_subject.place) ? nullptr : m_chunk->data();
            return m_chunk ? static_cast<VstIntPtr>(m_chunk->size()) : 0;
        case effSetChunk:
            m_chunk = std::string(static_cast<const char *>(pointer), static_cast<std::size_t>(value));
            return 0;
        case effGetPlugCategory:
            return number("category", m_subject.place == 0 && isShell() ? kPlugCategShell : kPlugCategEffect);
        case effSetSpeakerArrangement:
            return 1;
        case effEditGetRect:
            return editorRect(pointer);
        case effGetEffectName:
            fill(pointer, 1024, m_name);
            return 1;
        case effGetVendorString:
            fill(pointer, 256, script().text("vendor", m_subject.place, "Fixture Works"));
            return 1;
        case VstPublished::effGetParameterProperties:
            return properties(m_parameters[static_cast<std::size_t>(index)], pointer);
        case effGetVstVersion:
            return kVstVersion;
        default:
            return 0;
        }
    }

    static VstIntPtr properties(const FixtureScript::Words &parameter, void *pointer)
    {
        if (parameter.size() < 3)
            return 0;
        auto &target = *static_cast<VstPublished::VstParameterProperties *>(pointer);
        target = {};
        fill(target.label, sizeof target.label, parameter[2], false);
        fill(target.shortLabel, sizeof target.shortLabel, parameter[2], false);
        return 1;
    }

    VstIntPtr editorRect(void *pointer)
    {
        for (const FixtureScript::Words &words : script().all("editor", m_subject.place)) {
            m_editor = {0, 0, static_cast<short>(numberOf(words.at(1))),
                        static_cast<short>(numberOf(words[0]))};
            *static_cast<ERect **>(pointer) = &m_editor;
            return 1;
        }
        return 0;
    }

    /// What comes after the listed children is not in the trace and no stage: a host that never stops asking
    /// would fill the disk.
    VstIntPtr nextChild(void *pointer)
    {
        const auto &subjects = script().subjects;
        const std::string after = afterChildren();
        const std::size_t place = ++m_listed;
        if (place < subjects.size()) {
            script().reach("shell-next", subjects[place]);
            askHost("shell-next");
            fill(pointer, 1024, subjects[place].name);
            return answer("shell-next", subjects[place], subjects[place].number);
        }
        if (after == "repeat") {
            const FixtureSubject &child = subjects[1 + (place - 1) % (subjects.size() - 1)];
            fill(pointer, 1024, child.name);
            return child.number;
        }
        if (after == "endless") {
            const auto id = static_cast<std::int32_t>(1000000 + place - 1);
            fill(pointer, 1024, "Endless " + std::to_string(id));
            return id;
        }
        m_listed = 0;
        reach("shell-next", "end");
        return answer("shell-next", m_subject, 0);
    }

    VstIntPtr ask(const HostCall &call)
    {
        return m_host(&effect, call.opcode, call.index, call.value, nullptr, call.opt);
    }

    void noteAnswer(const HostCall &call, const std::string &text) const
    {
        script().note("host-" + std::to_string(call.opcode), m_subject, text);
    }

    /// Nests by way of the idle call, which the host hands back to the effect.
    void askAtDepth(const HostCall &call, int depth)
    {
        if (depth == 1)
            return noteAnswer(call, std::to_string(ask(call)));
        nestedCall = &call;
        nestedDepth = depth - 1;
        m_host(&effect, VstPublished::audioMasterIdle, 0, 0, nullptr, 0);
        if (nestedCall)
            noteAnswer(call, "not reached");
        nestedCall = nullptr;
    }

    FixtureSubject m_subject;
    audioMasterCallback m_host;
    std::string m_name;
    std::vector<FixtureScript::Words> m_parameters;
    std::vector<float> m_values;
    std::optional<std::string> m_chunk;
    ERect m_editor = {};
    std::size_t m_listed = 0; ///< children listed since the enumeration began
    std::vector<RepeatingThread> m_threads;
};

/// What the module handed out, for the module's life.
std::vector<std::unique_ptr<Effect>> &handedOut()
{
    static std::vector<std::unique_ptr<Effect>> effects;
    return effects;
}

} // namespace

AEffect *makeEffect(const FixtureSubject &subject, audioMasterCallback host, bool isOfSecondMain)
{
    handedOut().push_back(std::make_unique<Effect>(subject, host, isOfSecondMain));
    handedOut().back()->askHost("entry");
    return &handedOut().back()->effect;
}

void takeBack(AEffect *effect) { static_cast<Effect *>(effect->object)->close(); }

std::size_t openEffects()
{
    return static_cast<std::size_t>(std::count_if(handedOut().begin(), handedOut().end(),
                                                  [](const auto &effect) { return !effect->isClosed; }));
}
