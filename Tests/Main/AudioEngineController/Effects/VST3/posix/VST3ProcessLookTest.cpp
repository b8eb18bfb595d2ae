#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QRegularExpression>

#include <algorithm>

namespace {

class VST3ProcessLook : public VST3ScanBench {
protected:
    /// What the system tells of a scanner while it is in the call of a module.
    struct Look {
        QStringList status;
        QString workingFolder;
        bool isFirstMapped = false;
    };

    /// Has "a Spoiler" cause the effects, and looks while the module after it is being initialised.
    Look lookAfter(const QByteArray &effects)
    {
        add(QStringLiteral("a Spoiler"), effects + "class Spoiler\n");
        add(QStringLiteral("b Hanging"), "class Hanging\nfault initialize hang\n");
        for (const char *left : {"VST3Configuration.xml", "b Hanging.scan3"})
            QFile::remove(m_folder.effects() + QLatin1Char('/') + QLatin1String(left));
        m_folder.write(QStringLiteral("trace"), {});
        ScannerRun run(QStringLiteral(FXPROBE), m_folder);
        EXPECT_TRUE(run.start());
        EXPECT_TRUE(run.waitUntil([this] {
            return traceOf(QStringLiteral("b Hanging")).endsWith(QStringLiteral("initialize Hanging"));
        }));
        const QString process = QStringLiteral("/proc/%1/").arg(run.processId());
        Look look;
        look.status = statusOfWorker(process);
        look.workingFolder = QFileInfo(process + QStringLiteral("cwd")).symLinkTarget();
        look.isFirstMapped = m_folder.read(process + QStringLiteral("maps")).contains("a Spoiler");
        run.kill();
        m_log = run.wait().log;
        return look;
    }
    /// The thread that was started last.
    QStringList statusOfWorker(const QString &process) const
    {
        int worker = 0;
        for (const QString &thread : QDir(process + QStringLiteral("task")).entryList(QDir::Dirs))
            worker = std::max(worker, thread.toInt());
        return m_folder.lines(process + QStringLiteral("task/%1/status").arg(worker))
            .filter(QRegularExpression(QStringLiteral("^(Umask|SigBlk|SigIgn|SigCgt):")));
    }

    QString m_log;
};

const char kSignals[] =
    "effect initialize signal segv\neffect initialize signal fpe\neffect initialize signal ill\n"
    "effect initialize signal abrt\neffect initialize signal term\n"
    "effect initialize signal int\neffect initialize signal alrm\n";

} // namespace

TEST_F(VST3ProcessLook, WhatOneModuleChangesTheNextDoesNotFind)
{
    const struct {
        const char *name;
        QByteArray effects;
    } cases[] = {{"umask from the static constructor", "effect static-constructor umask 0777\n"},
                 {"umask while listed", "effect bus-info umask 0777\n"},
                 {"umask when the factory goes", "effect factory-release umask 0777\n"},
                 {"umask from the static destructor", "effect static-destructor umask 0777\n"},
                 {"working folder", "effect initialize chdir /\n"},
                 {"signal handlers", kSignals}};
    const Look clean = lookAfter({});
    ASSERT_EQ(clean.status.size(), 4);
    EXPECT_FALSE(clean.isFirstMapped);
    for (const auto &row : cases) {
        SCOPED_TRACE(row.name);
        const Look look = lookAfter(row.effects);
        EXPECT_EQ(look.status, clean.status);
        EXPECT_EQ(look.workingFolder, clean.workingFolder);
        EXPECT_EQ(records("Name Working"), texts({"Spoiler|1"}));
    }
}

TEST_F(VST3ProcessLook, AModuleThatLeavesAThreadStaysMapped)
{
    const QString sign = QStringLiteral(" left threads running and stays in memory");
    EXPECT_TRUE(lookAfter("effect initialize thread\n").isFirstMapped);
    EXPECT_TRUE(m_log.contains(modulePath(QStringLiteral("a Spoiler")) + sign));
    EXPECT_EQ(m_log.count(sign), 1);
}

TEST_F(VST3ProcessLook, APluginThatCallsExitRunsNobodysExitHandlers)
{
    add(QStringLiteral("Comp"), "class Comp\nfault initialize exit\n");
    EXPECT_EQ(scanOnce().exitCode, 0);
    EXPECT_EQ(traceOf(QStringLiteral("Comp")).last(), QStringLiteral("initialize Comp"));
}
