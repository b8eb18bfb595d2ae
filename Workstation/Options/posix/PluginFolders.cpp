#include "Workstation/Options/PluginFolders.h"

#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <QDir>

QStringList platformPluginFolders()
{
    // The VST 3 documentation, "Plug-in locations" (Linux); for CLAP the comments of its entry.h, and where
    // else distributions put libraries.
    const QString home = QDir::homePath();
    QStringList folders;
    for (const PluginFormatInfo &format : pluginFormats())
        for (const QString &start :
             {home + QStringLiteral("/."), QStringLiteral("/usr/local/lib/"), QStringLiteral("/usr/lib/"),
              QStringLiteral("/usr/lib64/"), QStringLiteral("/usr/lib/x86_64-linux-gnu/")})
            if (format.folderName)
                folders.append(start + QLatin1String(format.folderName));
    // VST 2 has no standard; these are where distributions and makers install them.
    folders += {home + QStringLiteral("/.vst"),
                home + QStringLiteral("/.lxvst"),
                QStringLiteral("/usr/local/lib/vst"),
                QStringLiteral("/usr/local/lib/lxvst"),
                QStringLiteral("/usr/lib/vst"),
                QStringLiteral("/usr/lib/lxvst"),
                QStringLiteral("/usr/lib64/vst"),
                QStringLiteral("/usr/lib64/lxvst"),
                QStringLiteral("/usr/lib/x86_64-linux-gnu/vst")};
    return folders;
}
