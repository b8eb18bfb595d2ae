#include "Main/AudioEngineController/Effects/PluginHost.h"

#include "Main/AudioEngineController/Effects/MRLAudioPluginHost.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/QtPrinters.h"
#include "Tests/Support/TestApplication.h"

#include <QDir>
#include <QFile>
#include <QTemporaryDir>

#include <gtest/gtest.h>

namespace {

void write(const QString &path, const QByteArray &text)
{
    ASSERT_TRUE(replaceFile(path, text, Durability::Buffered));
}

} // namespace

TEST(PluginHost, AScanWritesItsFilesAndSaysSo)
{
    const QTemporaryDir data;
    ASSERT_TRUE(QDir(data.path()).mkdir(QStringLiteral("Effects")));
    const TestApplication application({data.path()});
    PluginHost registry;
    registry.initialise(data.path(), QString(), 96000, 512);
    EXPECT_EQ(registry.completionEvent(), nullptr);
    const CapturedLog log;
    EXPECT_TRUE(registry.Scan(true, true));
    EXPECT_TRUE(registry.completionEvent()->isSet());
    EXPECT_TRUE(log.contains(QStringLiteral("Plugin Scan Complete")));
    EXPECT_EQ(application.changes, 1);
    EXPECT_EQ(registry.pluginMetadataFolder(), data.path() + QStringLiteral("/Plugin Metadata"));
    EXPECT_EQ(QDir(data.filePath(QStringLiteral("Effects"))).entryList(QDir::Files),
              QStringList({QStringLiteral("FXConfiguration.xml"), QStringLiteral("FXScan.xml"),
                           QStringLiteral("VST3Configuration.xml")}));
}

TEST(PluginHost, TheScannerLeavesTheScanListAlone)
{
    const QTemporaryDir data;
    ASSERT_TRUE(QDir(data.path()).mkdir(QStringLiteral("Effects")));
    const TestApplication application({}, true);
    PluginHost registry;
    registry.initialise(data.path(), QString(), 48000, 1024);
    registry.Scan(true, true);
    EXPECT_FALSE(QFile::exists(data.filePath(QStringLiteral("Effects/FXScan.xml"))));
    EXPECT_FALSE(QFile::exists(data.filePath(QStringLiteral("Effects/TesselFXConfiguration.xml"))));
}

TEST(PluginHost, RefreshingDoesNotNotify)
{
    const QTemporaryDir data;
    const TestApplication application;
    PluginHost registry;
    registry.initialise(data.path(), QString(), 48000, 1024);
    registry.Scan(false, true);
    EXPECT_EQ(application.changes, 0);
    EXPECT_TRUE(registry.completionEvent()->isSet());
}

TEST(PluginHost, AudioSettingsReachTheHosts)
{
    PluginHost registry;
    auto &vst2 = static_cast<VSTHost &>(registry.vst2Host());
    EXPECT_EQ(vst2.sampleRate(), 44100);
    EXPECT_EQ(vst2.blockSize(), 256);
    registry.initialise(QStringLiteral("/nowhere"), QString(), 48000, 1024);
    EXPECT_EQ(vst2.sampleRate(), 48000);
    registry.setIntParameter(IntParameter::BlockSize, 64);
    EXPECT_EQ(vst2.sampleRate(), 48000);
    EXPECT_EQ(vst2.blockSize(), 64);
}

TEST(PluginHost, MovingTheOldEffectsFolder)
{
    const struct {
        const char *name;
        bool oldHasCatalogue;
        bool newHasCatalogue;
        const char *newFolder; ///< data folder, below the test's
        bool isMoved;
        bool oldRemains;
    } rows[] = {
        {"moved and removed", true, false, "new", true, false},
        {"nothing to move, nothing removed", false, false, "new", false, true},
        {"never over an existing file", true, true, "new", false, true},
        {"the new folder inside the old one", true, false, "old/Effects/inner", true, true},
    };
    for (const auto &row : rows) {
        const QTemporaryDir test;
        const QString old = test.filePath(QStringLiteral("old/Effects"));
        const QString data = test.filePath(QString::fromLatin1(row.newFolder));
        const QString moved = data + QStringLiteral("/Effects/FXConfiguration.xml");
        QDir().mkpath(old + QStringLiteral("/sub"));
        write(old + QStringLiteral("/sub/file"), "x");
        if (row.oldHasCatalogue)
            write(old + QStringLiteral("/FXConfiguration.xml"), "old");
        if (row.newHasCatalogue) {
            QDir().mkpath(data + QStringLiteral("/Effects"));
            write(moved, "new");
        }
        const CapturedLog log;
        PluginHost registry;
        registry.initialise(data, old, 48000, 1024);
        QByteArray text;
        EXPECT_EQ(bool(readWholeFile(moved, text)), row.isMoved || row.newHasCatalogue) << row.name;
        EXPECT_EQ(text == "old", row.isMoved) << row.name;
        EXPECT_EQ(QDir(old).exists(), row.oldRemains) << row.name;
    }
}

TEST(PluginHost, MarksOnBuiltInEffectsAreReadAndWritten)
{
    const QTemporaryDir folder;
    const QString file = folder.filePath(QStringLiteral("TesselFXConfiguration.xml"));
    const QByteArray start = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<Effects version=\"1.2\">\n";
    const auto block = [](const char *id, const char *favourite, const char *mask) {
        return QByteArray("\t<Effect>\n\t\t<ID>") + id + "</ID>\n\t\t<Favourite>" + favourite +
               "</Favourite>\n\t\t<CategoryMask>" + mask + "</CategoryMask>\n\t</Effect>\n";
    };
    write(file,
          start + block("gone", "1", "0") + block("b", "-5", "2") + block("", "1", "0") + "</Effects>\n");
    TestApplication application({}, true);
    MRLAudioPluginHost host;
    host.setCatalogueFolder(folder.path());
    std::vector<EffectRecord> effects(2);
    effects[0].id = effects[0].name = QStringLiteral("a");
    effects[0].category = 0x40; // Delay
    effects[1].id = effects[1].name = QStringLiteral("b");
    const CapturedLog log;
    host.ReadCatalogue();
    EXPECT_EQ(log.lines(), QStringList()) << "nothing is lost where there are no effects";
    host.setBuiltInEffects(effects);
    EXPECT_TRUE(host.findEffect(QStringLiteral("b"))->favourite);
    EXPECT_EQ(host.findEffect(QStringLiteral("b"))->category, 0u) << "the mask is written only";
    EXPECT_EQ(log.count(QStringLiteral("is passed over")), 2);
    EXPECT_TRUE(log.contains(QStringLiteral("gone is passed over")));

    QByteArray text;
    EXPECT_FALSE(host.setFavourite(QStringLiteral("a"), true));
    EXPECT_TRUE(readWholeFile(file, text) && text.contains("gone")) << "not written by the scanner";
    application.scanner = false;
    EXPECT_FALSE(host.setFavourite(QStringLiteral("gone"), true));
    MRLAudioPluginHost without;
    without.setCatalogueFolder(folder.path());
    EXPECT_FALSE(without.writeMarks());
    EXPECT_TRUE(readWholeFile(file, text) && text.contains("gone")) << "no effects take no marks away";
    EXPECT_TRUE(host.setFavourite(QStringLiteral("b"), false));
    EXPECT_TRUE(readWholeFile(file, text));
    EXPECT_EQ(text.replace("\r\n", "\n"),
              start + block("a", "1", "4") + block("b", "0", "0") + "</Effects>\n");
    host.setBuiltInEffects(effects);
    EXPECT_TRUE(host.findEffect(QStringLiteral("a"))->favourite) << "the marks outlive new effects";
}
