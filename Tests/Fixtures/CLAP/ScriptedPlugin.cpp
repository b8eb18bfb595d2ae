#include "Tests/Fixtures/FixturePlatform.h"
#include "Tests/Fixtures/FixtureScript.h"

#include "Main/AudioEngineController/Effects/CLAP/CLAPInterface.h"

#include <algorithm>
#include <chrono>
#include <cstring>
#include <filesystem>
#include <memory>
#include <thread>
#include <vector>

namespace {

const FixtureScript &script()
{
    static const FixtureScript script = [] {
        FixtureScript read(
            {"class", false,
             "id vendor version features inputs outputs stated-inputs stated-outputs null older", "",
             "static-constructor entry-init get-factory plugin-count descriptor create-plugin init "
             "get-extension port-count port-info destroy entry-deinit static-destructor"});
        if (!read.exists)
            read.subjects.push_back({read.subjects[0].name, 0, 1});
        return read;
    }();
    return script;
}

/// What the script has for a part of a class, or of the module, that it leaves null.
template <typename Part>
Part unlessNull(const char *name, Part part, std::size_t place = 0)
{
    for (const FixtureScript::Words &words : script().all("null", place))
        if (std::find(words.begin(), words.end(), name) != words.end())
            return nullptr;
    return part;
}

clap_version_t versionOf(std::size_t place)
{
    return script().has("older", place) ? clap_version_t{0, 25, 0} : clap_version_t(CLAP_VERSION);
}

/// Whether the script lets a call succeed.
bool succeeds(const char *stage, const FixtureSubject &subject = {})
{
    return script().answer(stage, subject).empty();
}

enum class Entry { Unused, Initialised, Ended } entryState = Entry::Unused;
std::thread::id mainThread;

void expectEntry(const char *call)
{
    if (entryState != Entry::Initialised)
        reportMisuse(std::string(call) + " outside init and deinit of the entry");
    if (std::this_thread::get_id() != mainThread)
        reportMisuse(std::string(call) + " on another thread than init of the entry");
}

/// A plug-in of the module. It stays in memory when it is destroyed, so that a call after that is found out.
class Plugin {
public:
    explicit Plugin(const FixtureSubject &subject)
        : m_subject(subject)
        , m_id(text("id", "fixture." + subject.name))
        , m_vendor(text("vendor", "Fixture Works"))
        , m_version(text("version", "1.0"))
        , m_features(script().has("features", subject.place) ? script().all("features", subject.place).back()
                                                             : FixtureScript::Words{"audio-effect"})
    {
        for (const std::string &feature : m_features)
            m_featureTexts.push_back(feature.c_str());
        m_featureTexts.push_back(nullptr);
        descriptor.clap_version = versionOf(subject.place);
        descriptor.id = part("id", m_id.c_str());
        descriptor.name = part("name", m_subject.name.c_str());
        descriptor.vendor = part("vendor", m_vendor.c_str());
        descriptor.version = part("version", m_version.c_str());
        descriptor.features = part("features", m_featureTexts.data());
        plugin.desc = &descriptor;
        plugin.plugin_data = this;
        plugin.init = part("init", init);
        plugin.destroy = part("destroy", destroy);
        plugin.get_extension = part("get-extension", extension);
    }

    const clap_plugin *create(const clap_host *host)
    {
        if (!host || !host->name || !host->version || !host->get_extension || !host->request_restart ||
            !host->request_process || !host->request_callback)
            reportMisuse("'" + m_subject.name + "' was created by a host that is not whole");
        m_host = host;
        m_state = State::Created;
        reach("create-plugin");
        return succeeds("create-plugin", m_subject) ? &plugin : nullptr;
    }
    const FixtureSubject &subject() const { return m_subject; }

    clap_plugin_descriptor descriptor = {};
    clap_plugin plugin = {};

private:
    enum class State { None, Created, Initialised, Refused };

    std::string text(const char *key, const std::string &usual) const
    {
        return script().text(key, m_subject.place, usual);
    }
    template <typename Part>
    Part part(const char *name, Part usual) const
    {
        return unlessNull(name, usual, m_subject.place);
    }

    /// The plug-in of a call, which must be in one of two states.
    static Plugin &of(const clap_plugin *plugin, const char *call, State state, State other)
    {
        Plugin &self = *static_cast<Plugin *>(plugin->plugin_data);
        expectEntry(call);
        if (self.m_state != state && self.m_state != other)
            reportMisuse(std::string(call) + " of '" + self.m_subject.name + "' at the wrong time");
        return self;
    }
    void reach(const char *stage, const std::string &detail = {}) const
    {
        script().reach(stage, m_subject, detail);
        for (const FixtureScript::Words &words : script().all("ask-host"))
            if (words[0] == stage)
                askHost(words);
    }
    /// Says something, and asks for the thread; for ever on one of its own, if the script says so.
    void askHost(const FixtureScript::Words &words) const
    {
        const auto ask = [host = m_host, text = words.at(1)] {
            const auto *log = static_cast<const clap_host_log_t *>(host->get_extension(host, CLAP_EXT_LOG));
            const auto *check =
                static_cast<const clap_host_thread_check *>(host->get_extension(host, CLAP_EXT_THREAD_CHECK));
            log->log(host, CLAP_LOG_WARNING, text == "null" ? nullptr : text.c_str());
            host->request_callback(host);
            return std::string(check->is_main_thread(host) ? "main" : "other") +
                   (check->is_audio_thread(host) ? " audio" : "") +
                   (host->get_extension(host, "clap.none") || host->get_extension(host, nullptr) ? " more"
                                                                                                 : "");
        };
        std::string heard = ask();
        std::thread([&heard, ask] { heard += ' ' + ask(); }).join();
        script().note("host", m_subject, heard);
        if (words.size() > 2)
            std::thread([ask] {
                for (;; std::this_thread::sleep_for(std::chrono::milliseconds(1)))
                    ask();
            }).detach();
    }

    static bool CLAP_ABI init(const clap_plugin *plugin)
    {
        Plugin &self = of(plugin, "init", State::Created, State::Created);
        self.m_state = State::Refused;
        self.reach("init");
        if (succeeds("init", self.m_subject))
            self.m_state = State::Initialised;
        return self.m_state == State::Initialised;
    }
    static void CLAP_ABI destroy(const clap_plugin *plugin)
    {
        Plugin &self = of(plugin, "destroy", State::Initialised, State::Refused);
        self.m_state = State::None;
        self.reach("destroy");
    }
    static const void *CLAP_ABI extension(const clap_plugin *plugin, const char *id)
    {
        static const clap_plugin_audio_ports ports = {unlessNull("port-count", portCount),
                                                      unlessNull("port-info", portInfo)};
        const Plugin &self = of(plugin, "get_extension", State::Initialised, State::Initialised);
        self.reach("get-extension", id);
        return std::strcmp(id, CLAP_EXT_AUDIO_PORTS) == 0 && succeeds("get-extension", self.m_subject)
                   ? &ports
                   : nullptr;
    }

    /// The ports of a direction, each "CHANNELS" or "CHANNELS:aux".
    FixtureScript::Words ports(bool isInput) const
    {
        const auto stated = script().all(isInput ? "inputs" : "outputs", m_subject.place);
        return stated.empty() ? FixtureScript::Words{"2"} : stated.back();
    }
    static uint32_t CLAP_ABI portCount(const clap_plugin *plugin, bool isInput)
    {
        const Plugin &self = of(plugin, "count", State::Initialised, State::Initialised);
        self.reach("port-count", isInput ? "input" : "output");
        return static_cast<uint32_t>(script().number(isInput ? "stated-inputs" : "stated-outputs",
                                                     self.m_subject.place,
                                                     static_cast<std::int32_t>(self.ports(isInput).size())));
    }
    static bool CLAP_ABI portInfo(const clap_plugin *plugin, uint32_t index, bool isInput,
                                  clap_audio_port_info *info)
    {
        const Plugin &self = of(plugin, "get", State::Initialised, State::Initialised);
        const FixtureScript::Words ports = self.ports(isInput);
        if (index >= ports.size()) // not in the trace: a host that believes a huge count would fill the disk
            return false;
        self.reach("port-info", (isInput ? "input " : "output ") + std::to_string(index));
        const std::string &word = ports[index];
        info->flags = word.find(":aux") == std::string::npos ? CLAP_AUDIO_PORT_IS_MAIN : 0;
        info->channel_count = static_cast<uint32_t>(numberOf(word.substr(0, word.find(':'))));
        return succeeds("port-info", self.m_subject);
    }

    FixtureSubject m_subject;
    std::string m_id, m_vendor, m_version;
    FixtureScript::Words m_features;
    std::vector<const char *> m_featureTexts;
    const clap_host *m_host = nullptr;
    State m_state = State::None;
};

/// The script's, for the module's life.
const std::vector<std::unique_ptr<Plugin>> &plugins()
{
    static const std::vector<std::unique_ptr<Plugin>> all = [] {
        std::vector<std::unique_ptr<Plugin>> made;
        for (std::size_t place = 1; place < script().subjects.size(); ++place)
            made.push_back(std::make_unique<Plugin>(script().subjects[place]));
        return made;
    }();
    return all;
}

uint32_t CLAP_ABI pluginCount(const clap_plugin_factory *)
{
    expectEntry("get_plugin_count");
    script().reach("plugin-count");
    const std::string answer = script().answer("plugin-count");
    return static_cast<uint32_t>(answer.empty() ? static_cast<std::int32_t>(plugins().size())
                                                : numberOf(answer));
}

/// An index out of range is not in the trace.
const clap_plugin_descriptor *CLAP_ABI descriptor(const clap_plugin_factory *, uint32_t index)
{
    expectEntry("get_plugin_descriptor");
    if (index >= plugins().size())
        return nullptr;
    const Plugin &described = *plugins()[index];
    script().reach("descriptor", described.subject());
    return succeeds("descriptor", described.subject()) ? &described.descriptor : nullptr;
}

const clap_plugin *CLAP_ABI create(const clap_plugin_factory *, const clap_host *host, const char *id)
{
    expectEntry("create_plugin");
    for (const auto &plugin : plugins())
        if (plugin->descriptor.id && std::strcmp(plugin->descriptor.id, id) == 0)
            return plugin->create(host);
    return nullptr;
}

bool CLAP_ABI entryInit(const char *path)
{
    if (entryState != Entry::Unused)
        reportMisuse("init of the entry, twice");
    mainThread = std::this_thread::get_id();
    script().reach(
        "entry-init", {},
        path && std::filesystem::u8path(path) == std::filesystem::u8path(modulePath()) ? "" : "another path");
    entryState = succeeds("entry-init") ? Entry::Initialised : Entry::Ended;
    return entryState == Entry::Initialised;
}

void CLAP_ABI entryDeinit()
{
    expectEntry("deinit of the entry");
    entryState = Entry::Ended;
    script().reach("entry-deinit");
}

const void *CLAP_ABI getFactory(const char *id)
{
    static const clap_plugin_factory factory = {unlessNull("plugin-count", pluginCount),
                                                unlessNull("descriptor", descriptor),
                                                unlessNull("create-plugin", create)};
    expectEntry("get_factory");
    script().reach("get-factory");
    return std::strcmp(id, CLAP_PLUGIN_FACTORY_ID) == 0 && succeeds("get-factory") ? &factory : nullptr;
}

/// Runs the script's first and last stage with the library's own start-up and shutdown code.
struct ModuleLife {
    ModuleLife() { script().reach("static-constructor"); }
    ~ModuleLife() { script().reach("static-destructor"); }
} moduleLife;

} // namespace

const clap_plugin_entry_t clap_entry = {versionOf(0), unlessNull("entry-init", entryInit),
                                        unlessNull("entry-deinit", entryDeinit),
                                        unlessNull("get-factory", getFactory)};
