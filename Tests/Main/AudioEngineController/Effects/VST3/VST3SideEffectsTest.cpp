#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"
#include "Tests/Support/PlatformValues.h"

#include <QFile>

namespace {

using VST3SideEffects = VST3ScanBench;

} // namespace

TEST_F(VST3SideEffects, SpoiledStateSpoilsNoCatalogue)
{
    const QByteArray effects[] = {"static-constructor umask 0777",
                                  "bus-info umask 0777",
                                  "factory-release umask 0777",
                                  "static-destructor umask 0777",
                                  QByteArray("initialize locale ") + kForeignLocale,
                                  "initialize chdir /",
                                  "initialize rounding up",
                                  "initialize signal segv",
                                  "initialize alarm 1",
                                  "initialize thread"};
    QStringList expected;
    char place = 'a';
    for (const QByteArray &effect : effects) {
        const QByteArray name = QByteArray(1, place++) + " spoiler";
        add(name, "effect " + effect + "\nclass \"" + name + "\"\n");
        expected.append(name + "|2|1|1");
    }
    add("z", "class z\ninputs 1234567\ndelay initialize 1100\n"); // outlasts the alarm
    expected.append("z|1234567|1|1");
    const ScannerOutcome outcome = scan();
    EXPECT_EQ(sortedRecords("Name Inputs Enabled Working"), expected);
    EXPECT_EQ(QFile::permissions(m_folder.path("Effects/VST3Configuration.xml")),
              QFile::permissions(m_folder.scanList()));
    const QString sign = " left threads running and stays in memory";
    EXPECT_TRUE(outcome.log.contains(modulePath("j spoiler") + sign));
    EXPECT_EQ(outcome.log.count(sign), 1);
}
