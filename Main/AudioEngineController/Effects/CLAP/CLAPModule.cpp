#include "Main/AudioEngineController/Effects/CLAP/CLAPModule.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/FaultGuard.h"
#include "Main/AudioEngineController/Effects/CLAP/CLAPInterface.h"

#include <QDir>

namespace {

constexpr char kEntry[] = "clap_entry";

QString noEntry() { return QStringLiteral("it does not export clap_entry"); }

} // namespace

CLAPModule::CLAPModule(StageListener stageEntered)
    : m_stageEntered(std::move(stageEntered))
{}

CLAPModule::~CLAPModule() { close(); }

ModuleInspection CLAPModule::inspect(const QString &path)
{
    ModuleInspection file = PluginLibrary::inspect(path, {kEntry});
    if (file.verdict == ModuleInspection::Verdict::NoExport)
        file.reason = noEntry();
    return file;
}

QString CLAPModule::open(const QString &path)
{
    m_path = path;
    m_stageEntered(ProbeStage::Load);
    return m_library.load(path) ? initialise() : m_library.errorText();
}

QString CLAPModule::initialise()
{
    const auto *const entry = static_cast<const clap_plugin_entry *>(m_library.symbol(kEntry));
    if (!entry)
        return noEntry();
    if (!clap_version_is_compatible(entry->clap_version))
        return QStringLiteral("it is built for version %1.%2 of CLAP, which came before the first stable one")
            .arg(entry->clap_version.major)
            .arg(entry->clap_version.minor);
    if (!entry->init || !entry->deinit || !entry->get_factory)
        return QStringLiteral("its clap_entry lacks a function");
    m_stageEntered(ProbeStage::Start);
    const QByteArray path = QDir::toNativeSeparators(m_path).toUtf8();
    if (!callTranslated([&] { return entry->init(path.constData()); }))
        return QStringLiteral("its init function reports that it could not start");
    m_entry = entry;
    return QString();
}

const clap_plugin_factory *CLAPModule::factory(QString &reason)
{
    const auto *const factory =
        static_cast<const clap_plugin_factory *>(m_entry->get_factory(CLAP_PLUGIN_FACTORY_ID));
    if (!factory)
        reason = QStringLiteral("it has no plug-in factory");
    else if (!factory->get_plugin_count || !factory->get_plugin_descriptor || !factory->create_plugin)
        reason = QStringLiteral("its plug-in factory lacks a function");
    return reason.isEmpty() ? factory : nullptr;
}

bool CLAPModule::close()
{
    if (!m_library.isLoaded())
        return false;
    m_stageEntered(ProbeStage::Close);
    const clap_plugin_entry *const entry = std::exchange(m_entry, nullptr);
    if (const QString thrown = entry ? thrownBy([&] { entry->deinit(); }) : QString(); !thrown.isEmpty())
        DebugLog(L"%ls: while it was being closed, %ls", m_path, thrown);
    return !m_library.freeUnlessRunning();
}
