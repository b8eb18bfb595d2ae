#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"

#include "Main/AudioEngineController/Effects/Catalogue/VST3Catalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/VSTCatalogue.h"
#include "Tests/Support/TestFolder.h"

#include <QFile>
#include <QTemporaryDir>

#include <gtest/gtest.h>

namespace {

const MarkerFormat &vst3() { return vst3CatalogueFormat().marker; }
const MarkerFormat &vst2() { return vstCatalogueFormat().marker; }

} // namespace

TEST(CrashMarker, FileNames)
{
    const struct {
        const char *path, *name; ///< null: no name of its own
        const char *file;
    } rows[] = {
        {"/fx/Röhre x64.vst3", nullptr, "Röhre "},
        {"/fx/Shell.vst3", "Q10", "Q10"},
        {"/fx/Shell.vst3", "../A/B: <C>\"|?*\\", "___A_B_ _C______"},
        {"/fx/Shell.vst3", "tab\tnew\nline", "tab_new_line"},
        {"/fx/Shell.vst3", "", "_"},
        {"/fx/Shell.vst3", ".hidden", "_.hidden"},
        {"/fx/Shell.vst3", "nul", isDeviceName("nul") ? "_nul" : "nul"},
        {"/fx/Shell.vst3", "null", "null"},
    };
    for (const auto &row : rows) {
        EffectRecord record;
        record.path = row.path;
        EXPECT_EQ(CrashMarker(vst3(), "/e", record, row.name).path(), QString("/e/") + row.file + ".scan3");
    }
    const QTemporaryDir folder;
    const CrashMarker marker(vst3(), folder.path(), EffectRecord(), QString(300, QChar(0x771F)));
    EXPECT_TRUE(QFile::exists(marker.path())) << "cut to a length that every file system takes";
}

TEST(CrashMarker, IsWrittenAsItWasRead)
{
    const TestFolder folder;
    const std::tuple<const MarkerFormat &, const char *, quint32> rows[] = {{vst3(), "whole", 0},
                                                                            {vst2(), "whole", 0},
                                                                            {vst2(), "child", 0x80000000u},
                                                                            {vst2(), "no-xml", 7},
                                                                            {vst2(), "name-only", 0}};
    for (const auto &[format, file, subId] : rows) {
        const QByteArray text = folder.read(QStringLiteral(FXPROBE_FUZZ_CORPUS "/marker/%1.scan").arg(file));
        folder.write("marker", QByteArray(text).replace("\n", kLineEnd));
        EffectRecord record = readMarkerFile(format, folder.path("marker"));
        EXPECT_EQ(record.subId, subId) << file;
        EXPECT_FALSE(record.enabled) << file;
        record.subId |= format.hasSubId ? 0 : 9; // no other format's marker names one
        const CrashMarker marker(format, folder.dataFolder(), record, record.name);
        EXPECT_EQ(folder.read(marker.path()), folder.read("marker"));
        EXPECT_TRUE(text.contains("<Name>" + record.name.toUtf8() + "</Name>\n")) << text.constData();
    }
}

TEST(CrashMarker, AbandoningDeletesWhatIsActiveAndOnlyThen)
{
    const QTemporaryDir folder;
    bool ended = false;
    CrashMarker::abandonAll([&] { ended = true; });
    EXPECT_FALSE(ended) << "no plug-in is being probed";
    const CrashMarker marker(vst3(), folder.path(), EffectRecord(), "X");
    ASSERT_TRUE(QFile::exists(marker.path()));
    CrashMarker::abandonAll([&] { ended = true; });
    EXPECT_TRUE(ended);
    EXPECT_FALSE(QFile::exists(marker.path()));
}

TEST(CrashMarker, AFileBelongsToOneOwner)
{
    const QTemporaryDir folder;
    CrashMarker first(vst3(), folder.path(), EffectRecord(), "X");
    const QString path = first.path();
    CrashMarker namesake(vst3(), folder.path(), EffectRecord(), "x");
    EXPECT_EQ(namesake.path(), folder.filePath("2_x.scan3"));
    CrashMarker owner(std::move(first));
    EXPECT_EQ(owner.path(), path);
    owner = std::move(namesake);
    EXPECT_FALSE(QFile::exists(path)) << "the one that was owned before";
    EXPECT_TRUE(QFile::exists(owner.path()));
    const CrashMarker taken(vst3(), folder.path(), EffectRecord(), "Y", {folder.filePath("y.scan3")});
    EXPECT_EQ(taken.path(), folder.filePath("2_Y.scan3"));
}
