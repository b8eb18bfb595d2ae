#pragma once

#include "Tests/Fixtures/VST3/ScriptedModule.h"

#include <pluginterfaces/base/ipluginbase.h>

/// The factory of the scripted module: one object for the module's life.
class ScriptedFactory final : public Steinberg::IPluginFactory3 {
public:
    virtual ~ScriptedFactory() = default;

    Steinberg::tresult PLUGIN_API queryInterface(const Steinberg::TUID interfaceId, void **object) override;
    Steinberg::uint32 PLUGIN_API addRef() override;
    Steinberg::uint32 PLUGIN_API release() override;

    Steinberg::tresult PLUGIN_API getFactoryInfo(Steinberg::PFactoryInfo *info) override;
    Steinberg::int32 PLUGIN_API countClasses() override;
    Steinberg::tresult PLUGIN_API getClassInfo(Steinberg::int32 index, Steinberg::PClassInfo *info) override;
    Steinberg::tresult PLUGIN_API createInstance(Steinberg::FIDString classId,
                                                 Steinberg::FIDString interfaceId, void **object) override;
    Steinberg::tresult PLUGIN_API getClassInfo2(Steinberg::int32 index,
                                                Steinberg::PClassInfo2 *info) override;
    Steinberg::tresult PLUGIN_API getClassInfoUnicode(Steinberg::int32 index,
                                                      Steinberg::PClassInfoW *info) override;
    Steinberg::tresult PLUGIN_API setHostContext(Steinberg::FUnknown *context) override;

private:
    bool offers(const Steinberg::TUID interfaceId) const;

    Steinberg::uint32 m_references = 0;
};
