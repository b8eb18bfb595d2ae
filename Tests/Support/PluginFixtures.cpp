#include "Tests/Support/CLAPFixture.h"
#include "Tests/Support/PlatformValues.h"
#include "Tests/Support/VST2Fixture.h"
#include "Tests/Support/VST3Fixture.h"

#include <QDeadlineTimer>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QThread>

#include <gtest/gtest.h>

namespace {

// In the order of their enumerations.
const char *const kVst2Modules[] = {FXPROBE_SCRIPTED_VST2, FXPROBE_MAIN_VST2, FXPROBE_BOTH_VST2,
                                    FXPROBE_NO_ENTRY_VST3};
const char *const kVst3Modules[] = {FXPROBE_SCRIPTED_VST3, FXPROBE_PLAIN_VST3, FXPROBE_NO_ENTRY_VST3};

constexpr int kPatience = 10000; ///< ms

/// Whether a path is free. Windows keeps a module until the last process that loaded it has wholly ended.
bool clear(const QString &path)
{
    const QDeadlineTimer patience(kPatience);
    while (QFile::exists(path) && !QFile::remove(path) && !patience.hasExpired())
        QThread::msleep(20);
    return !QFile::exists(path);
}

/// Copies a module to a path, replacing what is there, so that a test can also update a plug-in. Its script
/// goes beside it; a null script gives no script file.
QString put(const QString &source, const QString &path, const QByteArray &script)
{
    QFile scriptFile(path + ".script");
    QDir().mkpath(QFileInfo(path).path());
    scriptFile.remove();
    EXPECT_TRUE(clear(path) && QFile::copy(source, path)) << qPrintable(source) << " to " << qPrintable(path);
    EXPECT_TRUE(script.isNull() ||
                (scriptFile.open(QIODevice::WriteOnly) && scriptFile.write(script) == script.size()))
        << qPrintable(scriptFile.errorString());
    return path;
}

} // namespace

QString vst2Ending() { return kVst2Ending; }

QString addVST2File(const QString &folder, const QString &name, const QByteArray &script, VST2Fixture fixture)
{
    return put(kVst2Modules[static_cast<int>(fixture)], folder + '/' + name + vst2Ending(), script);
}

QString addCLAPFile(const QString &folder, const QString &name, const QByteArray &script, bool isPlugin)
{
    return put(isPlugin ? FXPROBE_SCRIPTED_CLAP : FXPROBE_NO_ENTRY_VST3, folder + '/' + name + ".clap",
               script);
}

QString vst3FixturePath(VST3Fixture fixture) { return kVst3Modules[static_cast<int>(fixture)]; }

QString addVST3File(const QString &folder, const QString &name, const QByteArray &script, VST3Fixture fixture)
{
    return put(vst3FixturePath(fixture), folder + '/' + name + ".vst3", script);
}

QString addVST3Bundle(const QString &folder, const QString &name, const QByteArray &script)
{
    return put(vst3FixturePath(), folder + '/' + kBundleBinary.arg(name), script);
}
