#include "Tests/Fixtures/FixtureMisuse.h"
#include "Tests/Fixtures/VST3/ScriptedComponent.h"
#include "Tests/Fixtures/VST3/ScriptedModule.h"

#include <pluginterfaces/base/ipluginbase.h>

#include <algorithm>
#include <cstring>
#include <type_traits>

using namespace Steinberg;

namespace {

/// Copies a text into a field of the SDK. A text that fills the field gets no terminator; what lies behind a
/// shorter one is left as it was.
template <std::size_t Size>
void fill(char8 (&field)[Size], const std::string &text)
{
    std::memcpy(field, text.data(), std::min(Size, text.size()));
    if (text.size() < Size)
        field[text.size()] = '\0';
}

template <std::size_t Size>
void fill(char16 (&field)[Size], const std::string &text)
{
    for (std::size_t i = 0; i < std::min(Size, text.size()); ++i)
        field[i] = static_cast<unsigned char>(text[i]);
    if (text.size() < Size)
        field[text.size()] = 0;
}

/// What the three forms of a class's information have in common.
template <typename Info>
void fillCommon(Info &info, const ScriptedClass &described)
{
    described.id.toTUID(info.cid);
    info.cardinality = PClassInfo::kManyInstances;
    fill(info.category, described.category);
    fill(info.name, described.name);
}

/// What the two newer forms have beyond that.
template <typename Info>
void fillNewer(Info &info, const ScriptedClass &described)
{
    info.classFlags = 0;
    fill(info.subCategories, described.subCategories);
    fill(info.vendor, described.vendor);
    fill(info.version, described.version);
    fill(info.sdkVersion, "VST 3.7");
}

/// The class at an index, or null.
const ScriptedClass *classAt(int32 index)
{
    const auto &classes = scriptedModule().classes;
    const bool exists = index >= 0 && static_cast<std::size_t>(index) < classes.size();
    return exists ? &classes[static_cast<std::size_t>(index)] : nullptr;
}

const ScriptedClass *classWithId(FIDString id)
{
    for (const ScriptedClass &described : scriptedModule().classes) {
        if (FUnknownPrivate::iidEqual(described.id.toTUID(), id))
            return &described;
    }
    return nullptr;
}

/// Answers a request for the information on a class. An index out of range is not in the trace: a host that
/// believes a huge count would fill the disk.
template <typename Info>
tresult describe(const char *stage, int32 index, Info &info)
{
    const ScriptedClass *described = classAt(index);
    if (!described)
        return kInvalidArgument;
    scriptedModule().stages.reach(stage, described->name);
    const tresult result = scriptedModule().result(stage, described->name);
    if (result != kResultOk)
        return result;
    fillCommon(info, *described);
    if constexpr (!std::is_same_v<Info, PClassInfo>)
        fillNewer(info, *described);
    return kResultOk;
}

/// The factory of the scripted module: one object for the module's life.
class ScriptedFactory final : public IPluginFactory3 {
public:
    virtual ~ScriptedFactory() = default;

    tresult PLUGIN_API queryInterface(const TUID interfaceId, void **object) override
    {
        *object = nullptr;
        if (!offers(interfaceId))
            return kNoInterface;
        *object = static_cast<IPluginFactory3 *>(this);
        addRef();
        return kResultOk;
    }

    uint32 PLUGIN_API addRef() override { return ++m_references; }

    uint32 PLUGIN_API release() override
    {
        if (m_references == 0)
            reportMisuse("the factory was released once too often");
        if (--m_references == 0)
            scriptedModule().stages.reach("factory-release");
        return m_references;
    }

    tresult PLUGIN_API getFactoryInfo(PFactoryInfo *info) override
    {
        const ScriptedModule &module = scriptedModule();
        module.stages.reach("factory-info");
        const tresult result = module.result("factory-info");
        if (result != kResultOk)
            return result;
        fill(info->vendor, module.vendor);
        fill(info->url, {});
        fill(info->email, {});
        info->flags = PFactoryInfo::kUnicode;
        return kResultOk;
    }

    int32 PLUGIN_API countClasses() override
    {
        const ScriptedModule &module = scriptedModule();
        module.stages.reach("count-classes");
        return module.stages.answer("count-classes") ? module.result("count-classes")
                                                     : static_cast<int32>(module.classes.size());
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
        scriptedModule().stages.reach("set-host-context");
        return scriptedModule().result("set-host-context");
    }

    tresult PLUGIN_API createInstance(FIDString classId, FIDString interfaceId, void **object) override
    {
        const ScriptedClass *described = classWithId(classId);
        *object = nullptr;
        if (!described)
            return kInvalidArgument;
        scriptedModule().stages.reach("create-instance", described->name);
        const tresult result = scriptedModule().result("create-instance", described->name);
        if (result != kResultOk || scriptedModule().answers("null", "create-instance", described->name))
            return result;
        return createComponent(*described, interfaceId, object);
    }

private:
    bool offers(const TUID interfaceId) const
    {
        const FUID generations[] = {FUnknown::iid, IPluginFactory::iid, IPluginFactory2::iid,
                                    IPluginFactory3::iid};
        for (int generation = 0; generation <= scriptedModule().generation; ++generation) {
            if (FUnknownPrivate::iidEqual(interfaceId, generations[generation].toTUID()))
                return true;
        }
        return false;
    }

    uint32 m_references = 0;
};

/// Runs the script's first and last stage with the library's own start-up and shutdown code.
struct ModuleLife {
    ModuleLife() { scriptedModule().stages.reach("static-constructor"); }
    ~ModuleLife() { scriptedModule().stages.reach("static-destructor"); }
} moduleLife;

} // namespace

extern "C" SMTG_EXPORT_SYMBOL IPluginFactory *PLUGIN_API GetPluginFactory()
{
    static ScriptedFactory factory;
    scriptedModule().stages.reach("get-factory");
    if (scriptedModule().answers("null", "get-factory"))
        return nullptr;
    factory.addRef();
    return &factory;
}
