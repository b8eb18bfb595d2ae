#include "Main/AudioEngineController/Effects/VST3/VST3Module.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/FaultGuard.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeReport.h"
#include "Main/AudioEngineController/Effects/VST3/VST3ModuleFile.h"

#include <pluginterfaces/base/ipluginbase.h>

#include <exception>

namespace {
using FactoryFunction = Steinberg::IPluginFactory *(PLUGIN_API *)();
constexpr char kFactoryFunction[] = "GetPluginFactory";
} // namespace

VST3Module::~VST3Module() { close(); }

bool VST3Module::open(const QString &path)
{
    m_path = path;
    if (!m_library.isLoaded())
        load();
    if (m_library.isLoaded())
        m_initialised = true;
    if (!m_initialised)
        return false;
    ProbeReport::stage(ProbeStage::Start);
    const bool started = callTranslated([this] { return VST3ModuleFile::start(m_library); });
    if (!started) {
        DebugLog(L"The module %ls reports that it could not start", path);
        ProbeReport::reason(QStringLiteral("its entry function reports that it could not start"));
    }
    return started;
}

void VST3Module::load()
{
    ProbeReport::stage(ProbeStage::Load);
    QString reason;
    const QString binary = VST3ModuleFile::binary(m_path, reason);
    if (!binary.isEmpty() && !m_library.load(binary))
        reason = m_library.errorText();
    if (m_library.isLoaded())
        return;
    DebugLog(L"Cannot load the module %ls: %ls", m_path, reason);
    ProbeReport::reason(QStringLiteral("it could not be loaded: ") + reason);
}

bool VST3Module::exportsFactory() const { return m_library.symbol(kFactoryFunction) != nullptr; }

Steinberg::IPluginFactory *VST3Module::factory()
{
    if (m_factory)
        return m_factory;
    if (const auto getFactory = reinterpret_cast<FactoryFunction>(m_library.symbol(kFactoryFunction)))
        m_factory = callTranslated([&] { return getFactory(); });
    return m_factory;
}

/// Takes one step of closing. It happens in a destructor, out of which an exception would end the process: a
/// plug-in that was listed in full would be blamed for a crash.
template <typename Step>
void VST3Module::closeStep(Step step)
{
    try {
        callTranslated(step);
    } catch (const std::exception &error) {
        DebugLog(L"%ls: closing it, the plug-in threw: %s", m_path, error.what());
    } catch (...) {
        DebugLog(L"%ls: closing it, the plug-in threw something that is no standard exception", m_path);
    }
}

void VST3Module::close()
{
    if (!m_initialised)
        return;
    ProbeReport::stage(ProbeStage::Close);
    closeStep([this] {
        if (m_factory)
            m_factory->release();
    });
    m_factory = nullptr;
    closeStep([this] { VST3ModuleFile::end(m_library); });
    m_library.freeUnlessRunning();
    m_initialised = false;
}
