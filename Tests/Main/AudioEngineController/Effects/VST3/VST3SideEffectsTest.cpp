#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"
#include "Tests/Support/PlatformValues.h"

#include <QFile>

namespace {

using VST3SideEffects = VST3ScanBench;

} // namespace

TEST_F(VST3SideEffects, SpoiledStateSpoilsNoCatalogue)
{
    const QByteArray locale = QByteArray("locale ") + kForeignLocale;
    const QByteArray effects[] = {"umask 0777",    locale,        "chdir /", "rounding up",
                                  "rounding zero", "signal segv", "alarm 1", "thread"};
    QStringList expected;
    char place = 'a';
    for (const QByteArray &effect : effects) {
        const QByteArray name = QByteArray(1, place++) + " spoiler";
        add(QString::fromLatin1(name),
            QByteArray("effect initialize ") + effect + "\nclass \"" + name + "\"\n");
        expected.append(QString::fromLatin1(name) + QStringLiteral("|2|1|1"));
    }
    // Outlasts the alarm.
    add(QStringLiteral("z healthy"), "class \"z healthy\"\ninputs 1234567\ndelay initialize 1100\n");
    expected.append(QStringLiteral("z healthy|1234567|1|1"));
    scan();
    QStringList found = sortedRecords("Name Inputs Enabled Working");
    EXPECT_EQ(found, expected);
    EXPECT_EQ(QFile::permissions(m_folder.path(QStringLiteral("Effects/VST3Configuration.xml"))),
              QFile::permissions(m_folder.scanList()));
}
