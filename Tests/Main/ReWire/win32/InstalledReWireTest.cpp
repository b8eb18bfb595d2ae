#include "Main/ReWire/ReWireMixer.h"

#include "Tests/Support/ScannerRun.h"
#include "Tests/Support/TestFolder.h"

#include <QDir>

#include <gtest/gtest.h>

#include <optional>

namespace {

/// The shared folder of ReWire, with fixtures in it under the names that ReWire has.
class InstalledReWire : public testing::Test {
protected:
    void SetUp() override
    {
        const std::optional<std::string> common = installedReWireSystem()->commonFilesFolder();
        ASSERT_TRUE(common.has_value());
        m_vendorFolder = QString::fromStdString(*common) + "/Propellerhead Software";
        if (QDir(m_vendorFolder).exists()) {
            m_vendorFolder.clear();
            GTEST_SKIP() << "a ReWire library is installed here";
        }
        if (!QDir().mkpath(m_vendorFolder + "/ReWire"))
            GTEST_SKIP() << "the shared folder is not ours to write to";
    }
    void TearDown() override
    {
        if (!m_vendorFolder.isEmpty()) {
            EXPECT_TRUE(QDir(m_vendorFolder).removeRecursively());
        }
    }

    /// A place of the shared folder holds a fixture, or, where that has no name, nothing.
    void install(const char *library, const char *fixture) const
    {
        const QString place = m_vendorFolder + "/ReWire/" + QLatin1String(library);
        QFile::remove(place);
        if (*fixture) {
            ASSERT_TRUE(QFile::copy(QStringLiteral(FXPROBE_REWIRE_FIXTURES "/%1.dll").arg(fixture), place));
        }
    }

private:
    QString m_vendorFolder;
};

} // namespace

TEST_F(InstalledReWire, IsReportedByTheScanner)
{
    const struct {
        const char *name;
        const char *released, *beta, *debug; ///< fixtures
        int exitCode;
        const char *version; ///< in the output; empty: no such line
    } rows[] = {
        {"none", "", "", "", 1, ""},
        {"1.7", "1.7", "", "", 1, "1.7"},
        {"1.8", "1.8", "", "", 0, "1.8"},
        {"1.10", "1.10", "", "", 0, "1.10"},
        {"2.0", "2.0", "", "", 1, "2.0"},
        {"no version resource", "no-version", "", "", 1, "0.0"},
        {"beta before released", "1.8", "1.7", "", 1, "1.7"},
        {"debug before beta", "2.0", "1.7", "1.10", 0, "1.10"},
    };
    const TestFolder folder;
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        install("ReWire.dll", row.released);
        install("ReWireBeta.dll", row.beta);
        install("ReWireDebug.dll", row.debug);
        ScannerRun scanner(QStringLiteral(FXPROBE_SCANNER), folder);
        scanner.setArguments({"-rewire_version"});
        const ScannerOutcome outcome = scanner.run();
        const QByteArray line =
            *row.version ? QByteArray("REWIRE LIBRARY VERSION: ") + row.version + "\r\n" : QByteArray();
        EXPECT_EQ(outcome.exitCode, row.exitCode);
        EXPECT_EQ(outcome.standardOutput, line + (row.exitCode == 0 ? "INSTALLED REWIRE VERSION OK\r\n"
                                                                    : "REWIRE VERSION UPDATE REQUIRED\r\n"));
    }
}

TEST_F(InstalledReWire, OpensItsMixerInterface)
{
    const struct {
        const char *fixture;
        int result;
    } rows[] = {{"1.8", 1}, {"1.7", 101}, {"no-version", 101}, {"no-entry", 101}, {"refuses", 7}, {"", 100}};
    const auto system = installedReWireSystem();
    for (const auto &row : rows) {
        SCOPED_TRACE(row.fixture);
        install("ReWire.dll", row.fixture);
        ReWireMixer mixer(system.get());
        int seen = 0;
        EXPECT_EQ(mixer.open(&seen), row.result);
        EXPECT_EQ(seen, row.result == 1 || row.result == 7 ? 3000000 : 0);
        EXPECT_EQ(mixer.entry(ReWireEntry::DriveAudio) != nullptr, row.result == 1);
        EXPECT_EQ(mixer.entry(ReWireEntry::Idle), nullptr) << "no fixture has one";
    }
}
