#include "Main/AudioEngineController/Effects/VST3/VST3Module.h"

#include "Core/BaseLib/DebugLog.h"
#include "Core/BaseLib/FaultGuard.h"
#include "Main/AudioEngineController/Effects/VST3/VST3ModuleFile.h"

#include <pluginterfaces/base/ipluginbase.h>

#include <exception>

namespace {
using FactoryFunction = Steinberg::IPluginFactory *(PLUGIN_API *)();
}

VST3Module::~VST3Module() { close(); }

bool VST3Module::open(const QString &path)
{
    m_path = path;
    if (!m_library.isLoaded()) {
        QString reason;
        const QString binary = VST3ModuleFile::binary(path, reason);
        if (binary.isEmpty())
            DebugLog(L"Cannot load the module %ls: %ls", path, reason);
        else if (!m_library.load(binary))
            DebugLog(L"Cannot load the module %ls: %ls", path, m_library.errorText());
    }
    if (m_library.isLoaded())
        m_initialised = true;
    if (!m_initialised)
        return false;
    const bool started = callTranslated([this] { return VST3ModuleFile::start(m_library); });
    if (!started)
        DebugLog(L"The module %ls reports that it could not start", path);
    return started;
}

Steinberg::IPluginFactory *VST3Module::factory()
{
    if (m_factory)
        return m_factory;
    if (const auto getFactory = reinterpret_cast<FactoryFunction>(m_library.symbol("GetPluginFactory")))
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
    closeStep([this] {
        if (m_factory)
            m_factory->release();
    });
    m_factory = nullptr;
    closeStep([this] { VST3ModuleFile::end(m_library); });
    m_library.freeUnlessRunning();
    m_initialised = false;
}
