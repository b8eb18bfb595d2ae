#include "Workstation/Options/PluginFolders.h"

#include <QDir>

QStringList platformPluginFolders()
{
    // VST 3: the VST 3 documentation, "Plug-in locations" (Linux). VST 2 has no standard there; these are
    // where distributions and makers install them.
    const QString home = QDir::homePath();
    return {home + QStringLiteral("/.vst3"),
            QStringLiteral("/usr/local/lib/vst3"),
            QStringLiteral("/usr/lib/vst3"),
            QStringLiteral("/usr/lib64/vst3"),
            QStringLiteral("/usr/lib/x86_64-linux-gnu/vst3"),
            home + QStringLiteral("/.vst"),
            home + QStringLiteral("/.lxvst"),
            QStringLiteral("/usr/local/lib/vst"),
            QStringLiteral("/usr/local/lib/lxvst"),
            QStringLiteral("/usr/lib/vst"),
            QStringLiteral("/usr/lib/lxvst"),
            QStringLiteral("/usr/lib64/vst"),
            QStringLiteral("/usr/lib64/lxvst"),
            QStringLiteral("/usr/lib/x86_64-linux-gnu/vst")};
}
