#include "Main/AudioEngineController/Effects/KnownList.h"

#include "Core/BaseLib/TextFile.h"
#include "Tests/Support/QtPrinters.h"

#include <QTemporaryDir>

#include <gtest/gtest.h>

namespace {

EffectRecord known(const QString &path, const char *id, bool enabled = true, bool working = true,
                   quint32 subId = 0)
{
    EffectRecord record;
    record.path = path;
    record.id = QString::fromUtf8(id);
    record.enabled = enabled;
    record.working = working;
    record.subId = subId;
    return record;
}

QStringList idsOf(const KnownList::Records &records)
{
    QStringList ids;
    for (const EffectRecord *record : records)
        ids.append(record->id);
    return ids;
}

EffectRecord marker(const QString &path, const char *name, quint32 subId = 0)
{
    EffectRecord record;
    record.path = path;
    record.fileTime = QStringLiteral("2025-01-01 00:00");
    record.name = QString::fromUtf8(name);
    record.subId = subId;
    record.enabled = false;
    return record;
}

const QString kHere = QStringLiteral("/here/X.vst3");
const QString kThere = QStringLiteral("/there/X.vst3");

} // namespace

TEST(KnownList, WhichRecordSpeaksForAFile)
{
    const struct {
        const char *name;
        std::vector<EffectRecord> filed;
        QStringList order;
    } rows[] = {
        {"the order of the file", {known(kHere, "b"), known(kHere, "a")}, {"b", "a"}},
        {"the same path first", {known(kThere, "there"), known(kHere, "here")}, {"here", "there"}},
        {"what crashed as a whole first",
         {known(kHere, "class"), known(kHere, "crashed", false, false)},
         {"crashed", "class"}},
        {"what the user switched off stays in its place",
         {known(kHere, "class"), known(kHere, "off", false, true)},
         {"class", "off"}},
        {"disabled children last",
         {known(kHere, "bad child", false, false, 7), known(kHere, "child", true, true, 8)},
         {"child", "bad child"}},
        {"another path's crash does not come before this path",
         {known(kThere, "crashed", false, false), known(kHere, "class")},
         {"class", "crashed"}},
        {"file names of another case are others where the file system tells them apart",
         {known(QStringLiteral("/here/x.vst3"), "1")},
         kPathCase == Qt::CaseSensitive ? QStringList() : QStringList("1")},
    };
    for (const auto &row : rows) {
        KnownList list;
        for (const EffectRecord &record : row.filed)
            list.file(record);
        EXPECT_EQ(idsOf(list.recordsOfFileName(kHere)), row.order) << row.name;
    }
}

TEST(KnownList, WhatACrashMarkerAppliesTo)
{
    const QTemporaryDir folder;
    const QString existing = folder.filePath(QStringLiteral("X.vst3"));
    ASSERT_TRUE(replaceFile(existing, "x", Durability::Buffered));
    const struct {
        const char *name;
        std::vector<EffectRecord> filed;
        EffectRecord crash;
        std::size_t size;
        QStringList disabled; ///< identifiers of the records that are not usable afterwards
    } rows[] = {
        {"nothing known", {}, marker(kHere, "X"), 1, {"crash"}},
        {"the first of the same path",
         {known(kHere, "a"), known(kHere, "b")},
         marker(kHere, "X"),
         2,
         {"crash"}},
        {"the same name, its own file gone", {known(kThere, "a")}, marker(kHere, "X"), 1, {"crash"}},
        {"the same name, its own file there", {known(existing, "a")}, marker(kHere, "X"), 2, {"crash"}},
        {"a child of a shell",
         {known(kHere, "a", true, true, 1), known(kHere, "b", true, true, 2)},
         marker(kHere, "Child", 2),
         2,
         {"crash"}},
        {"a whole shell, beside its children",
         {known(kHere, "a", true, true, 1), known(kHere, "b", true, true, 2)},
         marker(kHere, "Shell"),
         3,
         {"crash"}},
        {"a child that is not known",
         {known(kHere, "a", true, true, 1)},
         marker(kHere, "Child", 3),
         2,
         {"crash"}},
    };
    for (const auto &row : rows) {
        KnownList list;
        for (const EffectRecord &record : row.filed)
            list.file(record);
        list.applyCrash(row.crash).id = QStringLiteral("crash");
        EXPECT_EQ(list.size(), row.size) << row.name;
        QStringList disabled;
        for (const EffectRecord *record : list.all()) {
            if (record->enabled && record->working)
                continue;
            disabled.append(record->id);
            EXPECT_EQ(record->path, row.crash.path) << row.name;
            EXPECT_EQ(record->subId, row.crash.subId) << row.name;
            EXPECT_EQ(record->fileTime, row.crash.fileTime) << row.name;
        }
        EXPECT_EQ(disabled, row.disabled) << row.name;
    }
}

TEST(KnownList, IdentifierHeldByAnother)
{
    KnownList list;
    list.file(known(kHere, "X"));
    EXPECT_FALSE(list.isIdHeldByOther(QStringLiteral("X"), known(kHere, "")));
    EXPECT_TRUE(list.isIdHeldByOther(QStringLiteral("X"), known(kThere, "")));
    EXPECT_TRUE(list.isIdHeldByOther(QStringLiteral("X"), known(kHere, "", true, true, 5)));
    EXPECT_FALSE(list.isIdHeldByOther(QStringLiteral("Y"), known(kThere, "")));
}
