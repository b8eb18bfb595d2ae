#include "Main/AudioEngineController/Effects/VST3/VST3Module.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/FaultGuard.h"
#include "Main/AudioEngineController/Effects/VST3/VST3ModuleFile.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Query.h"

#include <pluginterfaces/base/ipluginbase.h>

using namespace Steinberg;

namespace {
using FactoryFunction = IPluginFactory *(PLUGIN_API *)();
constexpr char kFactoryFunction[] = "GetPluginFactory";
} // namespace

VST3Module::VST3Module(StageListener stageEntered)
    : m_stageEntered(std::move(stageEntered))
{}

VST3Module::~VST3Module() { close(); }

ModuleInspection VST3Module::inspect(const QString &path)
{
    QString reason;
    const QString binary = VST3ModuleFile::binary(path, reason);
    if (binary.isEmpty())
        return {ModuleInspection::Verdict::Absent, reason};
    return PluginLibrary::inspect(binary);
}

std::optional<VST3Failure> VST3Module::open(const QString &path)
{
    const QString step = QLatin1String("VST3 Exception: Failed to get load module:") + path;
    m_path = path;
    if (!m_library.isLoaded()) {
        m_stageEntered(ProbeStage::Load);
        const QString reason = load();
        if (!m_library.isLoaded())
            return VST3Failure{step, reason};
    }
    m_initialised = true;
    m_stageEntered(ProbeStage::Start);
    if (!callTranslated([this] { return VST3ModuleFile::start(m_library); }))
        return VST3Failure{step, QStringLiteral("its entry function reports that it could not start")};
    return std::nullopt;
}

/// Loads the library; why that failed.
QString VST3Module::load()
{
    QString reason;
    const QString binary = VST3ModuleFile::binary(m_path, reason);
    if (binary.isEmpty() || m_library.load(binary))
        return reason;
    return m_library.errorText();
}

IPluginFactory *VST3Module::factory()
{
    if (m_factory)
        return m_factory;
    if (const auto getFactory = reinterpret_cast<FactoryFunction>(m_library.symbol(kFactoryFunction)))
        m_factory = callTranslated([&] { return getFactory(); });
    return m_factory;
}

std::optional<VST3Failure> VST3Module::queryFactory(IPluginFactory *&found)
{
    const QString step = QStringLiteral("VST3 Exception: Failed to get factory function");
    if (!factory())
        return VST3Failure{step, m_library.symbol(kFactoryFunction)
                                     ? QStringLiteral("GetPluginFactory returned null")
                                     : QStringLiteral("it does not export GetPluginFactory")};
    void *answer = nullptr;
    if (m_factory->queryInterface(IPluginFactory::iid, &answer) != kResultOk || !answer)
        return VST3Failure{step, QStringLiteral("its factory does not offer IPluginFactory")};
    found = static_cast<IPluginFactory *>(answer);
    return std::nullopt;
}

/// Takes one step of closing. It happens in a destructor, out of which an exception would end the process: a
/// plug-in that was listed in full would be blamed for a crash.
template <typename Step>
void VST3Module::closeStep(Step step)
{
    if (const QString thrown = thrownBy(step); !thrown.isEmpty())
        DebugLog(L"%ls: while it was being closed, %ls", m_path, thrown);
}

bool VST3Module::close()
{
    if (!m_initialised)
        return false;
    m_stageEntered(ProbeStage::Close);
    closeStep([this] {
        if (m_factory)
            m_factory->release();
    });
    m_factory = nullptr;
    closeStep([this] { VST3ModuleFile::end(m_library); });
    m_initialised = false;
    return !m_library.freeUnlessRunning();
}
