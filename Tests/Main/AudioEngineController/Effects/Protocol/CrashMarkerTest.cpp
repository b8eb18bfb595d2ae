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

EffectRecord crashed(const char *path, const char *time, const char *name, quint32 subId)
{
    EffectRecord record;
    record.path = path;
    record.fileTime = QString::fromUtf8(time);
    record.name = name;
    record.subId = subId;
    return record;
}

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
    for (const auto &row : rows)
        EXPECT_EQ(CrashMarker(vst3(), "/e", crashed(row.path, "", "", 0), row.name).path(),
                  QString("/e/") + row.file + ".scan3");
    const QTemporaryDir folder;
    const CrashMarker marker(vst3(), folder.path(), EffectRecord(), QString(300, QChar(0x771F)));
    EXPECT_TRUE(QFile::exists(marker.path())) << "cut to a length that every file system takes";
}

TEST(CrashMarker, TextAndWhatIsReadBack)
{
    const struct {
        const MarkerFormat &format;
        EffectRecord record;
        const char *body;
        quint32 subIdBack;
    } rows[] = {
        {vst3(), crashed("/fx/A & B.vst3", "2024-01-02 03:04", "真空管", 9),
         "\t<Path>/fx/A & B.vst3</Path>\n\t<Created>2024-01-02 03:04</Created>\n\t<Name>真空管</Name>\n", 0},
        {vst2(), crashed("", "", "N", 0), "\t<Name>N</Name>\n", 0},
        {vst2(), crashed("/fx/a<b>&.so", "t", "<<", 7), // no XML
         "\t<Path>/fx/a<b>&.so</Path>\n\t<Created>t</Created>\n\t<Name><<</Name>\n\t<SubID>7</SubID>\n", 7},
        {vst2(), crashed("/s.dll", "t", "C", 2147483648u),
         "\t<Path>/s.dll</Path>\n\t<Created>t</Created>\n\t<Name>C</Name>\n\t<SubID>-2147483648</SubID>\n",
         2147483648u},
    };
    const TestFolder folder;
    for (const auto &row : rows) {
        SCOPED_TRACE(row.body);
        const EffectRecord &record = row.record;
        const CrashMarker marker(row.format, folder.dataFolder(), record, record.name);
        const QString path = marker.path();
        EXPECT_EQ(folder.read(path).replace(kLineEnd, "\n"),
                  QByteArray("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<CrashedPlugin>\n") + row.body +
                      "</CrashedPlugin>\n");
        const EffectRecord back = readMarkerFile(row.format, path);
        EXPECT_EQ(back.path + back.fileTime + back.name, record.path + record.fileTime + record.name);
        EXPECT_EQ(back.subId, row.subIdBack);
        EXPECT_FALSE(back.enabled);
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
