#include "Main/ReWire/ReWireLibrary.h"

#include "Tests/Support/ScannerRun.h"
#include "Tests/Support/TestFolder.h"

#include <QDir>
#include <QScopeGuard>

#include <gtest/gtest.h>

TEST(InstalledReWire, IsReportedByTheScanner)
{
    const struct {
        const char *released, *debug; ///< fixtures; empty: not there
        const char *version;          ///< in the output; empty: no such line
        int exitCode;
    } rows[] = {{"", "", "", 1},         {"1.7", "", "1.7", 1},  {"1.8", "", "1.8", 0},
                {"1.10", "", "1.10", 0}, {"none", "", "0.0", 1}, {"1.7", "1.10", "1.10", 0}};
    const auto system = installedReWireSystem();
    const QString vendor =
        QString::fromStdString(system->commonFilesFolder().value()) + "/Propellerhead Software";
    if (QDir(vendor).exists() || !QDir().mkpath(vendor + "/ReWire"))
        GTEST_SKIP() << "a ReWire library is installed here, or its folder cannot be written";
    const auto remove = qScopeGuard([&vendor] { QDir(vendor).removeRecursively(); });
    const auto install = [&vendor](const char *name, const char *fixture) {
        QFile::remove(vendor + "/ReWire/" + name);
        if (*fixture)
            QFile::copy(QStringLiteral(FXPROBE_REWIRE_FIXTURES "/%1.dll").arg(fixture),
                        vendor + "/ReWire/" + name);
    };
    const TestFolder folder;
    for (const auto &row : rows) {
        install("ReWire.dll", row.released);
        install("ReWireDebug.dll", row.debug);
        ScannerRun scanner(QStringLiteral(FXPROBE_SCANNER), folder);
        scanner.setArguments({"-rewire_version"});
        const ScannerOutcome outcome = scanner.run();
        EXPECT_EQ(outcome.exitCode, row.exitCode) << row.released << row.debug;
        EXPECT_EQ(outcome.standardOutput.contains("REWIRE LIBRARY VERSION: "), *row.version != '\0');
        EXPECT_TRUE(outcome.standardOutput.contains(row.version)) << row.released << row.debug;
    }
    ReWireLibrary library(system.get());
    EXPECT_EQ(library.load(), ReWireResult::kOk);
    EXPECT_NE(library.function("RWM2OpenImp"), nullptr);
    EXPECT_EQ(library.function("RWM2CloseImp"), nullptr);
    library.free();
    install("ReWireDebug.dll", "");
}
