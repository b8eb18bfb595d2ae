#include "Core/BaseLib/WorkstationServices/NetworkPath.h"

#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

namespace {

/// A machine with a local drive C: and mapped drives from P: on, at which there are some files.
struct ScriptedDrives : NetworkDrives {
    List list() override
    {
        List drives{isKnown, 5, {"C:"}};
        for (int index = 0; index < remoteNames.size(); ++index)
            drives.devices.append(QChar('P' + index) + QString(":"));
        return isKnown ? drives : List{false, 5, {}};
    }
    std::optional<QString> remoteName(const QString &device) override
    {
        return device == "C:" ? std::nullopt : std::make_optional(remoteNames[device[0].unicode() - 'P']);
    }
    bool exists(const QString &path) override { return files.contains(path); }

    bool isKnown = true;
    QStringList remoteNames, files;
};

} // namespace

TEST(NetworkPath, IsFoundByShareOrByServer)
{
    const QString room(256, 'x'); // with a drive and a backslash the longest path that fits
    const struct {
        const char *name;
        QString path, remoteNames, result; ///< the names of the drives with blanks between
        bool onServer = true;
        QString files = {};
    } rows[] = {
        {"below a share, in other letters", R"(\\SRV\Snd\Ä)", R"(\\srv\sND)", R"(P:\Ä)"},
        {"second drive", R"(\\s\b\x)", R"(\\t\b \\s\b)", R"(Q:\x)"},
        {"longer share name ends the search", R"(\\s\abc\x)", R"(\\s\ab \\s\abc)", ""},
        {"longest result", R"(\\s\a\)" + room, R"(\\s\a)", R"(P:\)" + room},
        {"result too long", R"(\\s\a\x)" + room, R"(\\s\a)", ""},
        {"drive that has it", R"(\\S\D$\x)", R"(\\t\a \\s\a \\s\b)", R"(R:\x)", true, R"(P:\x R:\x)"},
        {"dollar before colon", R"(\\s\d:\x$\y)", R"(\\s\a)", R"(P:\y)", true, R"(P:\y P:\x$\y)"},
        {"neither dollar nor colon", R"(\\s\d\x)", R"(\\s\a)", "", true, R"(P:\x P:\d\x P:)"},
        {"no server", R"(\\)", R"(\\s\a \\)", "", false},
    };
    for (const auto &row : rows) {
        ScriptedDrives drives;
        drives.remoteNames = row.remoteNames.split(' ');
        drives.files = row.files.split(' ');
        wchar_t buffer[kNetworkPathBuffer] = {};
        EXPECT_EQ(mapToDrive(row.path.toStdWString(), buffer, drives), !row.result.isEmpty()) << row.name;
        EXPECT_EQ(QString::fromWCharArray(buffer), row.result) << row.name;
        EXPECT_EQ(isOnMappedServer(row.path.toStdWString(), drives), row.onServer) << row.name;
        drives.isKnown = false;
        EXPECT_FALSE(isOnMappedServer(row.path.toStdWString(), drives)) << row.name;
    }
}
