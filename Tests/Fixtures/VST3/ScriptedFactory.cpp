#include "Tests/Fixtures/VST3/VST3Script.h"

#include <pluginterfaces/base/ipluginbase.h>

#include <map>
#include <type_traits>

using namespace Steinberg;

namespace {

FixtureScript readScript()
{
    FixtureScript read({"class", false,
                        "category subcategories vendor controller state stated-inputs stated-outputs "
                        "inputs outputs id",
                        "factory-vendor generation",
                        "static-constructor module-entry get-factory set-host-context factory-info "
                        "count-classes class-info class-info2 class-info-unicode create-instance set-io-mode "
                        "initialize controller-class-id set-component-handler connect get-state "
                        "set-component-state set-state disconnect bus-count bus-info terminate release "
                        "factory-release module-exit static-destructor"});
    if (!read.exists)
        read.subjects.push_back({read.subjects[0].name, 0, 1});
    return read;
}

/// FNV-1a.
std::uint64_t hashOf(const std::string &text, std::uint64_t hash)
{
    for (const char character : text)
        hash = (hash ^ static_cast<unsigned char>(character)) * 0x100000001B3u;
    return hash;
}

} // namespace

const FixtureScript &script()
{
    static const FixtureScript script = readScript();
    return script;
}

std::string textOf(const FixtureSubject &described, const char *key, const char *usual)
{
    return script().text(key, described.place, usual);
}

tresult resultAt(const std::string &stage, const FixtureSubject &subject)
{
    static const std::map<std::string, tresult> names = {{"", kResultOk},
                                                         {"null", kResultOk},
                                                         {"blank", kResultOk},
                                                         {"false", kResultFalse},
                                                         {"internal-error", kInternalError}};
    const std::string answer = script().answer(stage, subject);
    const auto named = names.find(answer);
    return named != names.end() ? named->second : numberOf(answer);
}

FUID idOf(const FixtureSubject &described)
{
    FUID id;
    const std::string digits = textOf(described, "id");
    if (digits.empty()) {
        const std::uint64_t first = hashOf(described.name, 0xCBF29CE484222325u);
        const std::uint64_t second = hashOf(described.name, first);
        id = FUID(static_cast<uint32>(first >> 32), static_cast<uint32>(first),
                  static_cast<uint32>(second >> 32), static_cast<uint32>(second));
    } else if (digits.size() != 32 || !id.fromString(digits.c_str())) {
        reportMisuse("an id has 32 hexadecimal digits");
    }
    return id;
}

namespace {

/// Answers a request for the information on a class. An index out of range is not in the trace: a host that
/// believes a huge count would fill the disk.
template <typename Info>
tresult describe(const char *stage, int32 index, Info &info)
{
    const auto &subjects = script().subjects;
    if (index < 0 || static_cast<std::size_t>(index) >= subjects.size() - 1)
        return kInvalidArgument;
    const FixtureSubject &described = subjects[static_cast<std::size_t>(index) + 1];
    script().reach(stage, described);
    const tresult result = resultAt(stage, described);
    if (result != kResultOk || script().answer(stage, described) == "blank")
        return result;
    idOf(described).toTUID(info.cid);
    info.cardinality = PClassInfo::kManyInstances;
    fill(info.category, textOf(described, "category", "Audio Module Class"));
    fill(info.name, described.name);
    if constexpr (!std::is_same_v<Info, PClassInfo>) {
        info.classFlags = 0;
        fill(info.subCategories, textOf(described, "subcategories", "Fx"));
        fill(info.vendor, textOf(described, "vendor"));
        fill(info.version, "1.0.0");
        fill(info.sdkVersion, "VST 3.7");
    }
    return kResultOk;
}

/// The factory of the scripted module: one object for the module's life.
class ScriptedFactory final : public IPluginFactory3 {
public:
    ScriptedFactory()
    {
        for (const FixtureSubject &described : script().subjects)
            if (described.place != 0)
                m_places.emplace(idOf(described), described.place); // of two with one identifier the first
    }
    virtual ~ScriptedFactory() = default;

    tresult PLUGIN_API queryInterface(const TUID id, void **object) override
    {
        const FUID generations[] = {FUnknown::iid, IPluginFactory::iid, IPluginFactory2::iid,
                                    IPluginFactory3::iid};
        *object = nullptr;
        for (int generation = 0; generation <= script().number("generation", 0, 3); ++generation) {
            if (!FUnknownPrivate::iidEqual(id, generations[generation].toTUID()))
                continue;
            *object = static_cast<IPluginFactory3 *>(this);
            addRef();
            return kResultOk;
        }
        return kNoInterface;
    }

    uint32 PLUGIN_API addRef() override { return ++m_references; }

    uint32 PLUGIN_API release() override
    {
        if (m_references == 0)
            reportMisuse("the factory was released once too often");
        if (--m_references == 0)
            script().reach("factory-release");
        return m_references;
    }

    tresult PLUGIN_API getFactoryInfo(PFactoryInfo *info) override
    {
        script().reach("factory-info");
        const tresult result = resultAt("factory-info");
        if (result != kResultOk)
            return result;
        fill(info->vendor, script().text("factory-vendor", 0, "Fixture Works"));
        fill(info->url, {});
        fill(info->email, {});
        info->flags = PFactoryInfo::kUnicode;
        return kResultOk;
    }

    int32 PLUGIN_API countClasses() override
    {
        script().reach("count-classes");
        const std::string answer = script().answer("count-classes");
        return answer.empty() ? static_cast<int32>(script().subjects.size() - 1) : numberOf(answer);
    }

    tresult PLUGIN_API getClassInfo(int32 index, PClassInfo *info) override
    {
        return describe("class-info", index, *info);
    }
    tresult PLUGIN_API getClassInfo2(int32 index, PClassInfo2 *info) override
    {
        return describe("class-info2", index, *info);
    }
    tresult PLUGIN_API getClassInfoUnicode(int32 index, PClassInfoW *info) override
    {
        return describe("class-info-unicode", index, *info);
    }

    tresult PLUGIN_API setHostContext(FUnknown *) override
    {
        script().reach("set-host-context");
        return resultAt("set-host-context");
    }

    tresult PLUGIN_API createInstance(FIDString classId, FIDString interfaceId, void **object) override
    {
        *object = nullptr;
        const auto described = m_places.find(FUID::fromTUID(classId));
        if (described == m_places.end())
            return kInvalidArgument;
        const FixtureSubject &subject = script().subjects[described->second];
        script().reach("create-instance", subject);
        if (!script().answer("create-instance", subject).empty())
            return resultAt("create-instance", subject);
        return createInstanceOf(subject, interfaceId, object);
    }

private:
    std::map<FUID, std::size_t> m_places; ///< of the classes among the script's subjects
    uint32 m_references = 0;
};

/// Runs the script's first and last stage with the library's own start-up and shutdown code.
struct ModuleLife {
    ModuleLife() { script().reach("static-constructor"); }
    ~ModuleLife() { script().reach("static-destructor"); }
} moduleLife;

} // namespace

extern "C" SMTG_EXPORT_SYMBOL IPluginFactory *PLUGIN_API GetPluginFactory()
{
    static ScriptedFactory factory;
    script().reach("get-factory");
    if (!script().answer("get-factory").empty())
        return nullptr;
    factory.addRef();
    return &factory;
}

// The functions around a module's life, under their names on Linux and on Windows; scripted_vst3_plain has
// none.
#ifdef FIXTURE_HAS_ENTRY
static bool passStage(const char *stage, const char *detail)
{
    script().reach(stage, {}, detail);
    return script().answer(stage).empty();
}

extern "C" {
SMTG_EXPORT_SYMBOL bool ModuleEntry(void *handle)
{
    return passStage("module-entry", handle ? "" : "no handle");
}
SMTG_EXPORT_SYMBOL bool ModuleExit() { return passStage("module-exit", ""); }
SMTG_EXPORT_SYMBOL bool InitDll() { return passStage("module-entry", ""); }
SMTG_EXPORT_SYMBOL bool ExitDll() { return passStage("module-exit", ""); }
}
#endif
