#include "Workstation/Options/PluginFolders.h"

#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <QDir>
#include <QSettings>

namespace {

QString below(const char *variable, const QString &folder)
{
    const QString root = qEnvironmentVariable(variable);
    return root.isEmpty() ? QString() : QDir::fromNativeSeparators(root) + folder;
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
    // The VST 3 documentation, "Plug-in locations" (Windows); the comments of CLAP's entry.h.
    QStringList folders;
    for (const PluginFormatInfo &format : pluginFormats()) {
        const QString name = QLatin1Char('/') + QString::fromLatin1(format.folderName).toUpper();
        if (format.folderName)
            folders += {below("LOCALAPPDATA", QStringLiteral("/Programs/Common") + name),
                        below("CommonProgramW6432", name)};
    }
    // VST 2 has no standard beyond the registry value; the others are where makers install them.
    folders += {registeredVst2Folder(), below("ProgramW6432", QStringLiteral("/VSTPlugins")),
                below("ProgramW6432", QStringLiteral("/Steinberg/VSTPlugins")),
                below("CommonProgramW6432", QStringLiteral("/VST2")),
                below("CommonProgramW6432", QStringLiteral("/Steinberg/VST2"))};
    folders.removeAll(QString());
    return folders;
}
