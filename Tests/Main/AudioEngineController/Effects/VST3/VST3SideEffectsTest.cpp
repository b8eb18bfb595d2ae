#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"
#include "Tests/Support/PlatformValues.h"

#include <QFile>

namespace {

using VST3SideEffects = VST3ScanBench;

} // namespace

TEST_F(VST3SideEffects, SpoiledStateSpoilsNoCatalogue)
{
    const QByteArray locale = QByteArray("initialize locale ") + kForeignLocale;
    const QByteArray effects[] = {"static-constructor umask 0777",
                                  "bus-info umask 0777",
                                  "factory-release umask 0777",
                                  "static-destructor umask 0777",
                                  locale,
                                  "initialize chdir /",
                                  "initialize rounding up",
                                  "initialize rounding zero",
                                  "initialize signal segv",
                                  "initialize alarm 1",
                                  "initialize thread"};
    QStringList expected;
    char place = 'a';
    for (const QByteArray &effect : effects) {
        const QByteArray name = QByteArray(1, place++) + " spoiler";
        add(QString::fromLatin1(name), "effect " + effect + "\nclass \"" + name + "\"\n");
        expected.append(QString::fromLatin1(name) + QStringLiteral("|2|1|1"));
    }
    // Outlasts the alarm.
    add(QStringLiteral("z healthy"), "class \"z healthy\"\ninputs 1234567\ndelay initialize 1100\n");
    expected.append(QStringLiteral("z healthy|1234567|1|1"));
    const ScannerOutcome outcome = scan();
    EXPECT_EQ(sortedRecords("Name Inputs Enabled Working"), expected);
    EXPECT_EQ(QFile::permissions(m_folder.path(QStringLiteral("Effects/VST3Configuration.xml"))),
              QFile::permissions(m_folder.scanList()));
    const QString sign = QStringLiteral(" left threads running and stays in memory");
    EXPECT_TRUE(outcome.log.contains(modulePath(QLatin1Char(--place) + QStringLiteral(" spoiler")) + sign));
    EXPECT_EQ(outcome.log.count(sign), 1);
}
