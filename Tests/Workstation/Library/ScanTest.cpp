#include "Workstation/Library/Scan.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanLock.h"
#include "Tests/Support/ScanBench.h"

#include <QDir>
#include <QElapsedTimer>
#include <QFileInfo>
#include <QRegularExpression>

namespace {

/// The library's calls, with the real scanner on scripted plug-ins.
class LibraryScan : public ScanBench {
protected:
    LibraryScan()
    {
        m_settings.dataFolder = m_folder.dataFolder();
        m_settings.folders = QStringList(m_folder.plugins());
        m_settings.scannerProgram = scannerProgram();
        m_settings.jobs = 2;
        m_settings.progress = [this](const FxProbe::Progress &progress) { m_last = progress; };
    }

    /// "NAME STATE CHANNELS IDENTIFIER" of each plug-in.
    static QStringList lines(const FxProbe::Catalogue &catalogue)
    {
        QStringList lines;
        for (const FxProbe::Plugin &plugin : catalogue.plugins)
            lines += QStringLiteral("%1 %2 %3-%4 %5")
                         .arg(plugin.name, plugin.state)
                         .arg(plugin.inputs)
                         .arg(plugin.outputs)
                         .arg(plugin.identifier);
        return lines;
    }

    FxProbe::ScanSettings m_settings;
    FxProbe::Progress m_last;
};

} // namespace

TEST_F(LibraryScan, TellsWhatIsThereAndKeepsWhatIsAway)
{
    put("Comp.vst2", "inputs 1\nid 7\n");
    put("Killer.vst2", "fault static-constructor abort\n");
    m_settings.log = m_folder.path("scanner.log");
    const FxProbe::ScanResult result = FxProbe::scan(m_settings);
    EXPECT_TRUE(result) << qPrintable(result.reason);
    const QStringList expected{"Comp ok 1-2 vst2:Comp:7", "Killer disabled -1--1 "};
    EXPECT_EQ(lines(result), expected);
    EXPECT_EQ(lines(FxProbe::readCatalogue(m_folder.dataFolder())), expected);
    EXPECT_TRUE(result.plugins.at(1).reason.contains("while it was being loaded"))
        << qPrintable(result.plugins.at(1).reason);
    EXPECT_EQ(result.problems, QStringList());
    EXPECT_TRUE(m_last.done == 2 && m_last.planned == 2);
    EXPECT_FALSE(m_folder.read("scanner.log").isEmpty());
    EXPECT_FALSE(qEnvironmentVariableIsSet("FXPROBE_REPORT")) << "the caller's environment is its own";

    put("Killer.vst2",
        "trace " + m_folder.path("retried").toUtf8() + '\n'); // mended, with its old time stamp
    EXPECT_EQ(lines(FxProbe::scan(m_settings)), expected);
    m_settings.retry = QStringList("Comp");
    EXPECT_EQ(FxProbe::scan(m_settings).reason, "no disabled or failed plug-in is named 'Comp'");
    m_settings.retry = QStringList(result.plugins.at(1).path);
    EXPECT_EQ(FxProbe::scan(m_settings).plugins.at(1).state, "ok");

    m_settings.retry.clear();
    put("New.vst2");
    put("sub/Late.vst2", "id 8\n");
    m_settings.only = QStringList(m_folder.path("Plugins/sub"));
    EXPECT_EQ(lines(FxProbe::scan(m_settings)),
              QStringList(
                  {"Comp ok 1-2 vst2:Comp:7", "Killer ok 2-2 vst2:Killer:1000", "Late ok 2-2 vst2:Late:8"}));

    m_settings.only.clear();
    mark("Comp", "Favourite", "1");
    QDir(m_folder.dataFolder()).rename("Plugins", "Unplugged");
    const FxProbe::ScanResult away = FxProbe::scan(m_settings);
    EXPECT_TRUE(away);
    EXPECT_EQ(away.problems, QStringList(m_folder.plugins() + " could not be searched: it does not exist"));
    ASSERT_EQ(away.plugins.size(), 3u);
    EXPECT_EQ(away.plugins.front().state, "folder away");
    EXPECT_TRUE(away.plugins.front().isFavourite);
}

TEST_F(LibraryScan, CancelBlamesNobody)
{
    put("Comp.vst2");
    put("Hang.vst2", "fault entry hang\n");
    QElapsedTimer sinceHang;
    m_settings.progress = [&](const FxProbe::Progress &progress) {
        if (progress.name.startsWith("Hang") && progress.done == 1)
            sinceHang.start();
    };
    m_settings.isCancelled = [&] { return sinceHang.isValid(); };
    const FxProbe::ScanResult result = FxProbe::scan(m_settings);
    EXPECT_TRUE(result.reason.contains("cancelled")) << qPrintable(result.reason);
    EXPECT_EQ(lines(result), QStringList("Comp ok 2-2 vst2:Comp:1000"));
    EXPECT_LT(sinceHang.elapsed(), 20000);
}

TEST_F(LibraryScan, APluginThatIsPassedOverIsNotBlamed)
{
    put("Comp.vst2");
    put("Hang.vst2", "fault entry hang\n");
    m_settings.toSkip = [this] { return m_last.name.startsWith("Hang") ? m_last.path : QString(); };
    const FxProbe::ScanResult result = FxProbe::scan(m_settings);
    EXPECT_TRUE(result) << qPrintable(result.reason);
    EXPECT_TRUE(
        lines(result).join(' ').contains(QRegularExpression(R"(^Comp ok .* Hang\.\w+ skipped -1--1 $)")))
        << qPrintable(lines(result).join(' '));
    EXPECT_EQ(lines(FxProbe::readCatalogue(m_folder.dataFolder())),
              QStringList("Comp ok 2-2 vst2:Comp:1000"));
}

TEST_F(LibraryScan, SaysWhyItCannotScan)
{
    put("Comp.vst2");
    std::unique_ptr<ScanLock> lock;
    const struct {
        const char *name;
        std::function<void()> spoil;
        const char *reason;
    } rows[] = {
        {"no scanner", [this] { m_settings.scannerProgram = m_folder.path("none"); }, "there is no scanner"},
        {"a scanner that does not start", [this] { m_folder.write("none", "no program"); },
         "could not be started"},
        {"somebody else scans",
         [&] {
             m_settings.scannerProgram = scannerProgram();
             lock = std::make_unique<ScanLock>(m_folder.effects(), ScanLock::Role::Workstation);
         },
         "another scan is at work"},
        {"a data folder that is a file",
         [&] {
             lock.reset();
             m_settings.dataFolder = m_folder.path("none");
         },
         "cannot make the folder"},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        row.spoil();
        const FxProbe::ScanResult result = FxProbe::scan(m_settings);
        EXPECT_TRUE(result.reason.contains(row.reason)) << qPrintable(result.reason);
        EXPECT_EQ(lines(result), QStringList());
    }
}
