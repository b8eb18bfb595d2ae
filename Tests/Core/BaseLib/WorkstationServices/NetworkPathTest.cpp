#include "Core/BaseLib/WorkstationServices/NetworkPath.h"

#include "Tests/Core/BaseLib/Files/Fixtures.h"
#include "Tests/Support/CapturedLog.h"

#include <gtest/gtest.h>

#include <map>

namespace {

/// A machine with a local drive C:, mapped drives from P: on, and a few files.
class ScriptedDrives : public NetworkDrives {
public:
    explicit ScriptedDrives(const QStringList &remoteNames, const QStringList &files = {})
        : m_files(files)
    {
        m_list = {true, 0, {"C:"_q}};
        for (int index = 0; index < remoteNames.size(); ++index) {
            m_list.devices.append(QChar('P' + index) + ":"_q);
            m_remoteNames[m_list.devices.last()] = remoteNames.at(index);
        }
    }
    List list() override { return m_list; }
    std::optional<QString> remoteName(const QString &device) override
    {
        const auto found = m_remoteNames.find(device);
        return found == m_remoteNames.end() ? std::nullopt : std::make_optional(found->second);
    }
    bool exists(const QString &path) override { return m_files.contains(path); }

    List m_list;

private:
    std::map<QString, QString> m_remoteNames;
    QStringList m_files;
};

/// The drive path and what was logged; the texts are empty where there is none.
using Outcome = std::pair<QString, QString>;

Outcome map(const QString &path, ScriptedDrives &drives)
{
    const CapturedLog log;
    wchar_t buffer[kNetworkPathBuffer] = L"untouched";
    const bool isMapped = mapToDrive(path.toStdWString(), buffer, drives);
    EXPECT_TRUE(isMapped || buffer == std::wstring(L"untouched"));
    return {isMapped ? QString::fromWCharArray(buffer) : QString(), log.lines().join(QLatin1Char('\n'))};
}

/// The line that is logged for a path that was found, by its share or by its server.
QString logLine(const QString &path, const QString &result, bool byServer)
{
    if (result.isEmpty())
        return {};
    return byServer ? "Found via server name match '"_q + path + "'  >>> '"_q + result + "'"_q
                    : path + "  >>> "_q + result;
}

const QString kLong(256, 'x'); ///< with a drive and a backslash the longest path that fits
const QString kLongName = R"(\\s\)"_q + QString(255, 'n'); ///< the longest remote name

} // namespace

TEST(NetworkPath, IsFoundByShareOrByServer)
{
    const struct {
        const char *name;
        QString path;
        QString remoteNames; ///< of the drives from P: on, with blanks between
        QString result;
        bool onServer;
        QString files = {}; ///< those there are, where the server's name decides
    } rows[] = {
        {"below a share", R"(\\srv\snd\a\b.wav)"_q, R"(\\srv\snd)"_q, R"(P:\a\b.wav)"_q, true},
        {"in other letters", R"(\\SRV\Snd\Ä)"_q, R"(\\srv\sND)"_q, R"(P:\Ä)"_q, true},
        {"first of two drives", R"(\\s\a\x)"_q, R"(\\s\a \\s\a)"_q, R"(P:\x)"_q, true},
        {"second drive", R"(\\s\b\x)"_q, R"(\\t\b \\s\b)"_q, R"(Q:\x)"_q, true},
        {"no drive at all", R"(\\s\b\x)"_q, {}, {}, false},
        {"longer share name ends the search", R"(\\s\abc\x)"_q, R"(\\s\ab \\s\abc)"_q, {}, true},
        {"the share itself ends the search", R"(\\s\a)"_q, R"(\\s\a \\s)"_q, {}, true},
        {"empty remote name", R"(\\s\a\x)"_q, R"( \\s\a)"_q, R"(Q:\x)"_q, true},
        {"longest remote name", kLongName + R"(\x)"_q, kLongName, R"(P:\x)"_q, true},
        {"longer remote name", kLongName + R"(n\x)"_q, kLongName + 'n', {}, false},
        {"result that just fits", R"(\\s\a\)"_q + kLong, R"(\\s\a)"_q, R"(P:\)"_q + kLong, true},
        {"result too long", R"(\\s\a\x)"_q + kLong, R"(\\s\a)"_q, {}, true},
        {"by server", R"(\\s\D$\x)"_q, R"(\\s\a)"_q, R"(P:\x)"_q, true, R"(P:\x)"_q},
        {"server in other letters", R"(\\S\D$\x)"_q, R"(\\s\a)"_q, R"(P:\x)"_q, true, R"(P:\x)"_q},
        {"drive that has it", R"(\\s\D$\x)"_q, R"(\\t\a \\s\a \\s\b)"_q, R"(R:\x)"_q, true, R"(P:\x R:\x)"_q},
        {"nothing there", R"(\\s\D$\x)"_q, R"(\\s\a)"_q, {}, true},
        {"by the colon", R"(\\s\d:\x:y)"_q, R"(\\s\a)"_q, R"(P:\x:y)"_q, true, R"(P:\x:y)"_q},
        {"dollar first", R"(\\s\d:\x$\y)"_q, R"(\\s\a)"_q, R"(P:\y)"_q, true, R"(P:\y P:\x$\y)"_q},
        {"neither dollar nor colon", R"(\\s\d\x)"_q, R"(\\s\a)"_q, {}, true, R"(P:\x P:\d\x P:)"_q},
        {"server by a shorter name", R"(\\srv\D$\x)"_q, R"(\\sr\a)"_q, {}, false, R"(P:\x)"_q},
        {"share on a later drive", R"(\\s\D$\x)"_q, R"(\\s\a \\s\D$)"_q, R"(Q:\x)"_q, true},
        {"by server, too long", R"(\\s\$\x)"_q + kLong, R"(\\s\a)"_q, {}, true, R"(P:\x)"_q + kLong},
        {"no server", R"(\\)"_q, R"(\\s\a \\)"_q, {}, false},
        {"remote name without a server", R"(\\s\a)"_q, R"(\\)"_q, {}, false},
        {"empty path", {}, R"(\\s\a)"_q, {}, false},
    };
    for (const auto &row : rows) {
        const QChar blank(' ');
        ScriptedDrives drives(row.remoteNames.split(blank), row.files.split(blank));
        const QString line = logLine(row.path, row.result, !row.files.isEmpty());
        EXPECT_EQ(map(row.path, drives), Outcome(row.result, line)) << row.name;
        EXPECT_EQ(isOnMappedServer(row.path.toStdWString(), drives), row.onServer) << row.name;
    }
}

TEST(NetworkPath, AMissingListOfDrivesIsLogged)
{
    ScriptedDrives drives({});
    drives.m_list = {false, 5, {}};
    const QString line = "Failed in GetLogicalDriveStrings.  Error 5"_q;
    EXPECT_EQ(map(R"(\\s\a\x)"_q, drives), Outcome(QString(), line));
    const CapturedLog log;
    EXPECT_FALSE(isOnMappedServer(L"\\\\s\\a", drives));
    EXPECT_EQ(log.lines(), QStringList(line));
}

TEST(NetworkPath, ThisMachinesDrivesAreListed)
{
    const CapturedLog log;
    wchar_t buffer[kNetworkPathBuffer] = {};
    EXPECT_FALSE(mapToDrive(L"\\\\no-such-server\\share\\file", buffer));
    EXPECT_FALSE(isOnMappedServer(L"\\\\no-such-server\\share"));
    EXPECT_EQ(log.lines(), QStringList());
}
