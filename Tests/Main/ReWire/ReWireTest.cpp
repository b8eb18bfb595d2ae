#include "Main/ReWire/ReWireMixer.h"
#include "Main/ReWire/ReWireProbe.h"

#include "Tests/Support/QtPrinters.h"

#include <QStringList>

#include <gtest/gtest.h>

#include <cstring>
#include <functional>

namespace {

struct OpenCall {
    int version;
    void *argument;
};
OpenCall s_openCall;
int s_openResult;

int openMixer(int version, void *argument)
{
    s_openCall = {version, argument};
    return s_openResult;
}
void otherEntry() {}

/// A system of which every answer is set beforehand, and that notes what it is asked to load.
class ScriptedSystem : public ReWireSystem {
public:
    bool recentEnough = true;
    std::optional<std::string> folder = "C:\\Common";
    QStringList libraries = {"ReWire.dll"}; ///< those that load
    std::optional<std::string> path = "C:\\there.dll";
    std::optional<quint32> version = 0x10008;
    std::string missingFunction;

    QStringList tried;         ///< the names of the files
    std::string lastPath;      ///< the whole of the last one
    int loaded = 0, freed = 0; ///< how often

    bool isRecentEnough() override { return recentEnough; }
    std::optional<std::string> commonFilesFolder() override { return folder; }
    void *load(const std::string &file) override
    {
        lastPath = file;
        tried.append(QString::fromStdString(file).section('\\', -1));
        if (!libraries.contains(tried.last()))
            return nullptr;
        ++loaded;
        return this;
    }
    void *function(void *, const char *name) override
    {
        if (missingFunction == name)
            return nullptr;
        return std::strcmp(name, "RWM2OpenImp") == 0 ? reinterpret_cast<void *>(&openMixer)
                                                     : reinterpret_cast<void *>(&otherEntry);
    }
    void free(void *) override { ++freed; }
    std::optional<std::string> pathOf(void *) override { return path; }
    std::optional<quint32> fileVersion(const std::string &file) override
    {
        return file == *path ? version : std::nullopt;
    }
};

ScriptedSystem with(const std::function<void(ScriptedSystem &)> &change)
{
    ScriptedSystem system;
    change(system);
    return system;
}

ScriptedSystem ofVersion(std::optional<quint32> version)
{
    return with([&](ScriptedSystem &system) { system.version = version; });
}

const QStringList kAllNames = {"ReWireDebug.dll", "ReWireBeta.dll", "ReWire.dll"};

ScriptedSystem inFolder(size_t length)
{
    return with([&](ScriptedSystem &system) { system.folder = std::string(length, 'f'); });
}

} // namespace

TEST(ReWireLibrary, IsSearchedUnderItsNamesInOrder)
{
    const auto first = [](int count) { return kAllNames.mid(0, count); };
    struct {
        const char *name;
        ScriptedSystem system;
        int result;
        QStringList tried;
    } rows[] = {
        {"released", {}, 1, kAllNames},
        {"beta before released", with([](auto &s) { s.libraries = kAllNames.mid(1); }), 1, first(2)},
        {"debug before all", with([](auto &s) { s.libraries = kAllNames; }), 1, first(1)},
        {"none", with([](auto &s) { s.libraries.clear(); }), 100, kAllNames},
        {"no folder", with([](auto &s) { s.folder.reset(); }), 100, {}},
        {"system too old", with([](auto &s) { s.recentEnough = false; }), 109, {}},
        {"folder that leaves room for all names", inFolder(212), 1, kAllNames},
        {"folder that leaves none for the longest", inFolder(213), 1, kAllNames.mid(1)},
        {"folder that just leaves room", inFolder(217), 1, kAllNames.mid(2)},
        {"folder that is too long by one", inFolder(218), 100, {}},
        {"folder that fills the buffer", inFolder(259), 100, {}},
    };
    for (auto &row : rows) {
        SCOPED_TRACE(row.name);
        {
            ReWireLibrary library(&row.system);
            EXPECT_EQ(library.load(), row.result);
            EXPECT_EQ(library.isLoaded(), row.result == 1);
            EXPECT_EQ(row.system.tried, row.tried);
        }
        EXPECT_EQ(row.system.freed, row.system.loaded);
    }
    EXPECT_EQ(rows[0].system.lastPath, "C:\\Common\\Propellerhead Software\\ReWire\\ReWire.dll");
    EXPECT_EQ(ReWireLibrary(nullptr).load(), 109);
}

/// The verdict on each installation, by the version probe and by the mixer interface.
TEST(ReWireVersion, OnlyTheFirstLineFromItsEighthReleaseOnIsAccepted)
{
    struct {
        const char *name;
        ScriptedSystem system;
        int verdict;
        const char *output;
        int mixerResult;
    } rows[] = {
        {"1.7", ofVersion(0x10007), 1, "REWIRE LIBRARY VERSION: 1.7\n", 101},
        {"1.8", ofVersion(0x10008), 0, "REWIRE LIBRARY VERSION: 1.8\n", 1},
        {"1.10", ofVersion(0x1000a), 0, "REWIRE LIBRARY VERSION: 1.10\n", 1},
        {"1.32767", ofVersion(0x17fff), 0, "REWIRE LIBRARY VERSION: 1.32767\n", 1},
        {"numbers are signed", ofVersion(0x1ffff), 1, "REWIRE LIBRARY VERSION: 1.-1\n", 101},
        {"major number, too", ofVersion(0xffff0008), 1, "REWIRE LIBRARY VERSION: -1.8\n", 101},
        {"0.9", ofVersion(0x00009), 1, "REWIRE LIBRARY VERSION: 0.9\n", 101},
        {"2.0", ofVersion(0x20000), 1, "REWIRE LIBRARY VERSION: 2.0\n", 101},
        {"2.8", ofVersion(0x20008), 1, "REWIRE LIBRARY VERSION: 2.8\n", 101},
        {"no version resource", ofVersion({}), 1, "REWIRE LIBRARY VERSION: 0.0\n", 101},
        {"path not to be told", with([](auto &s) { s.path.reset(); }), 1, "", 101},
        {"not installed", with([](auto &s) { s.libraries.clear(); }), 1, "", 100},
        {"system too old", with([](auto &s) { s.recentEnough = false; }), 1, "", 109},
    };
    for (auto &row : rows) {
        SCOPED_TRACE(row.name);
        testing::internal::CaptureStdout();
        const int verdict = probeReWireVersion(&row.system);
        std::fflush(stdout);
        EXPECT_EQ(testing::internal::GetCapturedStdout(), row.output);
        EXPECT_EQ(verdict, row.verdict);
        EXPECT_EQ(row.system.freed, row.system.loaded);
        ReWireMixer mixer(&row.system);
        EXPECT_EQ(mixer.addLoad(), row.mixerResult);
        EXPECT_EQ(mixer.loadCount(), row.mixerResult == 1 ? 1 : 0);
        EXPECT_EQ(row.system.loaded - row.system.freed, mixer.loadCount()) << "held, and no more";
    }
}

TEST(ReWireMixer, IsOpenWithAllItsFunctionsOrNotAtAll)
{
    const struct {
        const char *missing;
        int answer; ///< of the library's open function
        int result;
    } rows[] = {
        {"", 1, 1},
        {"RWM2IdleImp", 1, 1},
        {"RWM2OpenImp", 1, 101},
        {"RWM2DriveAudioImp", 1, 101},
        {"RWM2SetAudioInfoImp", 1, 101},
        {"", 0, 0},
        {"", -1, -1},
        {"", 6, 6},
    };
    for (const auto &row : rows) {
        for (const int others : {0, 1}) {
            SCOPED_TRACE(testing::Message() << row.missing << ", " << row.answer << ", " << others);
            ScriptedSystem system;
            system.missingFunction = row.missing;
            s_openResult = row.answer;
            s_openCall = {};
            ReWireMixer mixer(&system);
            if (others == 1) {
                EXPECT_EQ(mixer.addLoad(), 1);
            }
            const bool isOpen = row.result == 1;
            EXPECT_EQ(mixer.open(&system), row.result);
            EXPECT_EQ(system.loaded, 1);
            EXPECT_EQ(mixer.loadCount(), others + (isOpen ? 1 : 0));
            EXPECT_EQ(system.freed, mixer.loadCount() == 0 ? 1 : 0);
            EXPECT_EQ(s_openCall.argument, row.result == 101 ? nullptr : &system);
            EXPECT_EQ(s_openCall.version, row.result == 101 ? 0 : 3000000);
            EXPECT_EQ(mixer.entry(ReWireEntry::Open) != nullptr, isOpen);
            EXPECT_EQ(mixer.entry(ReWireEntry::SetAudioInfo) != nullptr, isOpen);
            EXPECT_EQ(mixer.open(&system), isOpen ? 6 : row.result) << "the second time";
        }
    }
}
