#include "Workstation/Options/PluginFolders.h"

#include <QDir>
#include <QSettings>

namespace {

QString below(const char *variable, const char *folder)
{
    const QString root = qEnvironmentVariable(variable);
    return root.isEmpty() ? QString() : QDir::fromNativeSeparators(root) + QString::fromLatin1(folder);
}

/// Where installers of VST 2 plug-ins put them, as they told the registry.
QString registeredVst2Folder()
{
    const QSettings key(QStringLiteral("HKEY_LOCAL_MACHINE\\SOFTWARE\\VST"), QSettings::Registry64Format);
    return QDir::fromNativeSeparators(key.value(QStringLiteral("VSTPluginsPath")).toString());
}

} // namespace

QStringList platformPluginFolders()
{
    // VST 3: the VST 3 documentation, "Plug-in locations" (Windows). VST 2 has no standard beyond the
    // registry value; the others are where makers install them.
    QStringList folders{below("LOCALAPPDATA", "/Programs/Common/VST3"),
                        below("CommonProgramW6432", "/VST3"),
                        registeredVst2Folder(),
                        below("ProgramW6432", "/VSTPlugins"),
                        below("ProgramW6432", "/Steinberg/VSTPlugins"),
                        below("CommonProgramW6432", "/VST2"),
                        below("CommonProgramW6432", "/Steinberg/VST2")};
    folders.removeAll(QString());
    return folders;
}
