#include "Main/AudioEngineController/Effects/VST3/VST3Module.h"

#include "Core/BaseLib/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST3/VST3ModuleFile.h"

#include <pluginterfaces/base/ipluginbase.h>

namespace {
using FactoryFunction = Steinberg::IPluginFactory *(PLUGIN_API *)();
}

VST3Module::~VST3Module() { close(); }

bool VST3Module::open(const QString &path)
{
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
    const bool started = VST3ModuleFile::start(m_library);
    if (!started)
        DebugLog(L"The module %ls reports that it could not start", path);
    return started;
}

Steinberg::IPluginFactory *VST3Module::factory()
{
    if (m_factory)
        return m_factory;
    if (const auto getFactory = reinterpret_cast<FactoryFunction>(m_library.symbol("GetPluginFactory")))
        m_factory = getFactory();
    return m_factory;
}

void VST3Module::close()
{
    if (!m_initialised)
        return;
    if (m_factory)
        m_factory->release();
    m_factory = nullptr;
    VST3ModuleFile::end(m_library);
    m_library.freeUnlessRunning();
    m_initialised = false;
}
