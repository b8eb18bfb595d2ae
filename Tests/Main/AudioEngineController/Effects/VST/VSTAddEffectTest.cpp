#include "Core/BaseLib/DebugLog.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST/VSTModuleFile.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/QtPrinters.h"

#include <QLocale>

#include <gtest/gtest.h>

#include <clocale>
#include <vector>

namespace {

EffectRecord recordOf(const char *file, const char *id, const char *name)
{
    EffectRecord record;
    record.path = QStringLiteral("/fx/") + QString::fromUtf8(file) + VSTModuleFile::ending();
    record.id = QString::fromUtf8(id);
    record.name = QString::fromUtf8(name);
    return record;
}

/// "FILE|ID|NAME" of each record, in the order of the identifiers.
QStringList listed(const VSTHost &host)
{
    QStringList lines;
    for (const EffectRecord &record : host.effects())
        lines.append(fileNameOf(record.path).chopped(VSTModuleFile::ending().size()) + QLatin1Char('|') +
                     record.id + QLatin1Char('|') + record.name);
    return lines;
}

} // namespace

TEST(WaveShellVersion, IsReadFromNamesOfTheOnePattern)
{
    const struct {
        const char *name; // without the ending of the platform
        double version;
    } cases[] = {{"WaveShell1-VST 9.3_x64", 9.3},
                 {"WaveShell2-VST 9.2_x64", 9.2},
                 {"WaveShell10-VST 10.25_x64", 10.25},
                 {"WaveShell1-VST 12_x64", 12.0},
                 {"WaveShell1-VST 9.3", 0.0},
                 {"WaveShell1-VST 9,3_x64", 0.0},
                 {"WaveShell1-VST _x64", 0.0},
                 {"WaveShell1-VST nine_x64", 0.0},
                 {"WaveShell1-VST nan_x64", 0.0},
                 {"WaveShell-VST 9.3_x64", 0.0},
                 {"WaveShell1-VST3 9.3_x64", 0.0},
                 {"waveshell1-VST 9.3_x64", 0.0},
                 {"My WaveShell1-VST 9.3_x64", 0.0},
                 {"WaveShell1-VST 9.3_x64 copy", 0.0},
                 {"", 0.0}};
    const QLocale before;
    for (const char *locale : {"C", "C.UTF-8", "de_DE.UTF-8"}) {
        std::setlocale(LC_ALL, locale);
        QLocale::setDefault(QLocale(QString::fromLatin1(locale)));
        for (const auto &row : cases)
            EXPECT_EQ(waveShellVersion(QString::fromLatin1(row.name) + VSTModuleFile::ending()), row.version)
                << row.name << " in " << locale;
    }
    std::setlocale(LC_ALL, "C");
    QLocale::setDefault(before);
    EXPECT_EQ(waveShellVersion(QStringLiteral("WaveShell1-VST 9.3_x64.vst3")), 0.0);
}

TEST(VSTAddEffect, OfTwoSpecialShellsTheNewerStays)
{
    const char *const old = "WaveShell1-VST 9.2_x64";
    const char *const newer = "WaveShell1-VST 9.3_x64";
    const struct {
        const char *name;
        const char *first;
        const char *second;
        bool replaces;
    } cases[] = {{"newer after older", old, newer, true},
                 {"older after newer", newer, old, false},
                 {"same version", newer, "WaveShell2-VST 9.3_x64", false},
                 {"higher number before the version", newer, "WaveShell2-VST 9.2_x64", false},
                 {"compared as numbers", newer, "WaveShell1-VST 10.1_x64", true},
                 {"without a version after one with", old, "WaveShell", false},
                 {"with a version after one without", "WaveShell", old, true},
                 {"the rule is for the later one's path", "Other", newer, true},
                 {"another file after a shell", old, "Other", false},
                 {"in a folder of that name", "WaveShell/Other", "WaveShell/WaveShell1-VST 9.3_x64", true}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.name);
        VSTHost host;
        EXPECT_TRUE(host.AddEffect(recordOf(row.first, "Q10:1234", "Q10")));
        EXPECT_EQ(host.AddEffect(recordOf(row.second, "Q10:1234", "Q10")), row.replaces);
        const QString stays = fileNameOf(QString::fromLatin1(row.replaces ? row.second : row.first));
        EXPECT_EQ(listed(host), QStringList(stays + QStringLiteral("|Q10:1234|Q10")));
    }
}
