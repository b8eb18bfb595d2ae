#include "Main/AudioEngineController/Effects/CrashMarker.h"

#include "Main/AudioEngineController/Effects/VST/VSTCatalogue.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Catalogue.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/QtPrinters.h"

#include <QDir>
#include <QFile>
#include <QTemporaryDir>

#include <gtest/gtest.h>

namespace {

const MarkerFormat &vst3() { return vst3CatalogueFormat().marker; }
const MarkerFormat &vst2() { return vstCatalogueFormat().marker; }

EffectRecord crashed(const char *path, const char *time, const char *name, quint32 subId)
{
    EffectRecord record;
    record.path = QString::fromUtf8(path);
    record.fileTime = QString::fromUtf8(time);
    record.name = QString::fromUtf8(name);
    record.subId = subId;
    return record;
}

} // namespace

TEST(CrashMarker, FileNames)
{
    const struct {
        const char *path;
        QString name;
        const char *file;
    } rows[] = {
        {"/fx/Synth x64.vst3", QString(), "/e/Synth .scan3"},
        {"/fx/Röhre.vst3", QString(), "/e/Röhre.scan3"},
        {"/fx/Shell.vst3", QStringLiteral("Q10"), "/e/Q10.scan3"},
        {"/fx/Shell.vst3", QStringLiteral("../A/B: <C>\"|?*\\"), "/e/___A_B_ _C______.scan3"},
        {"/fx/Shell.vst3", QStringLiteral("tab\tnew\nline"), "/e/tab_new_line.scan3"},
        {"/fx/Shell.vst3", QStringLiteral(""), "/e/_.scan3"},
        {"/fx/Shell.vst3", QStringLiteral(".hidden"), "/e/_.hidden.scan3"},
    };
    for (const auto &row : rows)
        EXPECT_EQ(markerPath(vst3(), QStringLiteral("/e"), QString::fromUtf8(row.path), row.name),
                  QString::fromUtf8(row.file));
}

TEST(CrashMarker, ANameOfAnyLengthGivesAFileThatCanBeMade)
{
    const QTemporaryDir folder;
    const QString path = markerPath(vst3(), folder.path(), QString(), QString(300, QChar(0x771F)));
    EXPECT_TRUE(writeMarkerFile(vst3(), path, EffectRecord()));
    EXPECT_TRUE(QFile::exists(path));
}

TEST(CrashMarker, TextAndWhatIsReadBack)
{
    const struct {
        const char *name;
        const MarkerFormat &format;
        EffectRecord record;
        const char *body;
        quint32 subIdBack;
    } rows[] = {
        {"VST 3", vst3(), crashed("/fx/A & B.vst3", "2024-01-02 03:04", "真空管", 9),
         "\t<Path>/fx/A & B.vst3</Path>\n\t<Created>2024-01-02 03:04</Created>\n\t<Name>真空管</Name>\n", 0},
        {"VST 3, nothing known", vst3(), crashed("", "", "", 0),
         "\t<Path></Path>\n\t<Created></Created>\n\t<Name></Name>\n", 0},
        {"VST 2, nothing known", vst2(), crashed("", "", "N", 0), "\t<Name>N</Name>\n", 0},
        {"VST 2, a child", vst2(), crashed("/s.dll", "t", "C", 1234),
         "\t<Path>/s.dll</Path>\n\t<Created>t</Created>\n\t<Name>C</Name>\n\t<SubID>1234</SubID>\n", 1234},
        {"VST 2, a child with the top bit set", vst2(), crashed("/s.dll", "t", "C", 2147483648u),
         "\t<Path>/s.dll</Path>\n\t<Created>t</Created>\n\t<Name>C</Name>\n\t<SubID>-2147483648</SubID>\n",
         2147483648u},
    };
    const QTemporaryDir folder;
    const QString path = folder.filePath(QStringLiteral("marker"));
    for (const auto &row : rows) {
        ASSERT_TRUE(writeMarkerFile(row.format, path, row.record)) << row.name;
        QByteArray text;
        ASSERT_TRUE(readWholeFile(path, text));
        EXPECT_EQ(text.replace(kLineEnd, "\n"),
                  QByteArray("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<CrashedPlugin>\n") + row.body +
                      "</CrashedPlugin>\n")
            << row.name;
        const EffectRecord back = readMarkerFile(row.format, path);
        EXPECT_EQ(back.path, row.record.path) << row.name;
        EXPECT_EQ(back.fileTime, row.record.fileTime) << row.name;
        EXPECT_EQ(back.name, row.record.name) << row.name;
        EXPECT_EQ(back.subId, row.subIdBack) << row.name;
        EXPECT_FALSE(back.enabled) << row.name;
    }
}

TEST(CrashMarker, TextThatIsNoXmlIsReadByItsLines)
{
    const QTemporaryDir folder;
    const QString path = folder.filePath(QStringLiteral("marker"));
    const EffectRecord record = crashed("/fx/a<b>&.so", "2024-01-02 03:04", "<<", 2147483648u);
    ASSERT_TRUE(writeMarkerFile(vst2(), path, record));
    const CapturedLog log;
    const EffectRecord back = readMarkerFile(vst2(), path);
    EXPECT_EQ(back.path, record.path);
    EXPECT_EQ(back.fileTime, record.fileTime);
    EXPECT_EQ(back.name, record.name);
    EXPECT_EQ(back.subId, record.subId);
}

TEST(CrashMarker, AbandoningDeletesWhatIsActiveAndOnlyThen)
{
    const QTemporaryDir folder;
    const QString path = folder.filePath(QStringLiteral("X.scan3"));
    bool ended = false;
    ActiveMarkers::abandon([&] { ended = true; });
    EXPECT_FALSE(ended) << "no plug-in is being probed";
    ASSERT_TRUE(writeMarkerFile(vst3(), path, EffectRecord()));
    ActiveMarkers::add(path);
    ActiveMarkers::abandon([&] { ended = true; });
    EXPECT_TRUE(ended);
    EXPECT_FALSE(QFile::exists(path));
    ActiveMarkers::remove(path);
}
