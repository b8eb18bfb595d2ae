#include "Main/ReWire/ReWireMixer.h"
#include "Main/ReWire/ReWireProbe.h"

#include "Tests/Support/QtPrinters.h"

#include <QStringList>

#include <gtest/gtest.h>

#include <cstring>

namespace {

int s_version = 0; ///< of the mixer interface, as its open function was asked for
int s_openResult = 0;

int openMixer(int version, void *)
{
    s_version = version;
    return s_openResult;
}

/// A system of which every answer is set beforehand, and that notes what it is asked to load.
class ScriptedSystem : public ReWireSystem {
public:
    bool recentEnough = true;
    QString folder = "C:\\Common";    ///< none when null
    QString libraries = "ReWire.dll"; ///< those that load
    std::optional<quint32> version = 0x10008;
    std::string missingFunction;

    QString tried;             ///< the last path
    int loaded = 0, freed = 0; ///< how often

    bool isRecentEnough() override { return recentEnough; }
    std::optional<std::string> commonFilesFolder() override
    {
        return folder.isNull() ? std::nullopt : std::make_optional(folder.toStdString());
    }
    void *load(const std::string &file) override
    {
        tried = QString::fromStdString(file);
        if (!libraries.split(' ').contains(tried.section('\\', -1)))
            return nullptr;
        ++loaded;
        return this;
    }
    void *function(void *, const char *name) override
    {
        return missingFunction == name ? nullptr : reinterpret_cast<void *>(openMixer);
    }
    void free(void *) override { ++freed; }
    std::optional<std::string> pathOf(void *) override { return "there.dll"; }
    std::optional<quint32> fileVersion(const std::string &) override { return version; }
};

} // namespace

TEST(ReWireLibrary, IsSearchedUnderItsNamesInOrder)
{
    const struct {
        QString folder, libraries;
        int result;
        QString lastTried;
    } rows[] = {
        {"C:\\C", "ReWire.dll", 1, "C:\\C\\Propellerhead Software\\ReWire\\ReWire.dll"},
        {"", "ReWireBeta.dll ReWire.dll", 1, "\\Propellerhead Software\\ReWire\\ReWireBeta.dll"},
        {"", "ReWireDebug.dll ReWireBeta.dll", 1, "\\Propellerhead Software\\ReWire\\ReWireDebug.dll"},
        {"C:\\C", "", 100, "C:\\C\\Propellerhead Software\\ReWire\\ReWire.dll"},
        {QString(), "ReWire.dll", 100, ""},
        {QString(217, 'f'), "", 100, QString(217, 'f') + "\\Propellerhead Software\\ReWire\\ReWire.dll"},
        {QString(218, 'f'), "", 100, ""},
    };
    for (const auto &row : rows) {
        ScriptedSystem system;
        system.folder = row.folder;
        system.libraries = row.libraries;
        EXPECT_EQ(ReWireLibrary(&system).load(), row.result);
        EXPECT_EQ(system.tried, row.lastTried);
        EXPECT_EQ(system.freed, system.loaded);
    }
}

/// The verdict on each installation, by the version probe and by the mixer interface.
TEST(ReWireVersion, OnlyTheFirstLineFromItsEighthReleaseOnIsAccepted)
{
    const struct {
        std::optional<quint32> version;
        std::string shown;
        bool isAccepted;
    } rows[] = {{0x10007, "1.7", false}, {0x10008, "1.8", true},   {0x1000a, "1.10", true},
                {0x20008, "2.8", false}, {0x1ffff, "1.-1", false}, {std::nullopt, "0.0", false}};
    for (const auto &row : rows) {
        ScriptedSystem system;
        system.version = row.version;
        testing::internal::CaptureStdout();
        EXPECT_EQ(probeReWireVersion(&system), row.isAccepted ? 0 : 1) << row.shown;
        std::fflush(stdout);
        EXPECT_EQ(testing::internal::GetCapturedStdout(), "REWIRE LIBRARY VERSION: " + row.shown + '\n');
        ReWireMixer mixer(&system);
        EXPECT_EQ(mixer.addLoad(), row.isAccepted ? 1 : 101) << row.shown;
        EXPECT_EQ(system.loaded - system.freed, mixer.loadCount()) << row.shown << ": held, and no more";
    }
    ScriptedSystem tooOld;
    tooOld.recentEnough = false;
    EXPECT_EQ(probeReWireVersion(&tooOld), 1);
    EXPECT_EQ(ReWireMixer(nullptr).addLoad(), 109);
}

TEST(ReWireMixer, IsOpenWithAllItsFunctionsOrNotAtAll)
{
    const struct {
        const char *missing;
        int answer, result; ///< of the library's open function, and of ours
    } rows[] = {{"", 1, 1}, {"RWM2IdleImp", 1, 1}, {"RWM2SetAudioInfoImp", 1, 101}, {"", 6, 6}};
    for (const auto &row : rows) {
        ScriptedSystem system;
        system.missingFunction = row.missing;
        s_openResult = row.answer;
        s_version = 0;
        ReWireMixer mixer(&system);
        const bool isOpen = row.result == 1;
        EXPECT_EQ(mixer.open(&system), row.result) << row.missing;
        EXPECT_EQ(s_version, row.result == 101 ? 0 : 3000000) << row.missing;
        EXPECT_EQ(mixer.loadCount(), 1 - system.freed) << row.missing;
        EXPECT_EQ(mixer.entry(ReWireEntry::DriveAudio) != nullptr, isOpen) << row.missing;
        EXPECT_EQ(mixer.open(&system), isOpen ? 6 : row.result) << row.missing;
    }
}
