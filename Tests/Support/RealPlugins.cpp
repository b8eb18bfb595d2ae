#include "Tests/Support/RealPlugins.h"

#include "Tests/Support/TestFolder.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QProcess>

#include <gtest/gtest.h>

QString realPlugins(const TestFolder &folder)
{
    const QString built = QStringLiteral(FXPROBE_WINDOWS_PLUGINS);
    if (!built.isEmpty())
        return QFileInfo::exists(built + "/vst3") ? built : QString();
    QProcess dpkg;
    dpkg.start("dpkg", {"--listfiles", "zam-plugins", "dpf-plugins-vst"});
    if (!dpkg.waitForFinished() || dpkg.exitCode() != 0)
        return QString();
    const QString installed = "/usr/lib/";
    for (const QString &file : QString::fromUtf8(dpkg.readAllStandardOutput()).split('\n')) {
        const QString link = folder.path("Real/" + file.mid(installed.size()));
        if (!file.startsWith(installed + "vst") || !QFileInfo(file).isFile())
            continue;
        EXPECT_TRUE(QDir().mkpath(QFileInfo(link).path()) && QFile::link(file, link)) << qPrintable(link);
    }
    return folder.path("Real");
}
