#include "Main/AudioEngineController/Effects/Catalogue/KnownList.h"

#include "Core/BaseLib/Files/TextFile.h"
#include "Tests/Support/QtPrinters.h"

#include <QTemporaryDir>

#include <gtest/gtest.h>

namespace {

EffectRecord known(const QString &path, const char *id, quint32 subId = 0, bool enabled = true,
                   bool working = true)
{
    EffectRecord record;
    record.path = path;
    record.id = id;
    record.subId = subId;
    record.enabled = enabled;
    record.working = working;
    return record;
}

const QString kHere = "/here/X.vst3";
const QString kThere = "/there/X.vst3";

} // namespace

TEST(KnownList, WhichRecordSpeaksForAFile)
{
    const EffectRecord child = known(kHere, "class", 8);
    const struct {
        const char *name;
        std::vector<EffectRecord> filed;
        const char *order;
    } rows[] = {
        {"the order of the file", {known(kHere, "b"), known(kHere, "a")}, "b a "},
        {"the same path first", {known(kThere, "there"), known(kHere, "here")}, "here there "},
        {"what crashed as a whole first",
         {child, known(kHere, "crashed", 0, false, false)},
         "crashed class "},
        {"what the user switched off stays in its place",
         {child, known(kHere, "off", 0, false)},
         "class off "},
        {"disabled children last", {known(kHere, "bad", 7, false, false), child}, "class bad "},
        {"another path's crash does not come before this path",
         {known(kThere, "crashed", 0, false, false), child},
         "class crashed "},
        {"file names of another case are others where the file system tells them apart",
         {known("/here/x.vst3", "1")},
         kPathCase == Qt::CaseSensitive ? "" : "1 "},
    };
    for (const auto &row : rows) {
        KnownList list;
        for (const EffectRecord &record : row.filed)
            list.file(record);
        QString order;
        for (const EffectRecord *record : list.recordsOfFileName(kHere))
            order += record->id + ' ';
        EXPECT_EQ(order, row.order) << row.name;
    }
}

TEST(KnownList, WhatACrashMarkerAppliesTo)
{
    const QTemporaryDir folder;
    const QString existing = folder.filePath("X.vst3");
    ASSERT_TRUE(replaceFile(existing, "x", Durability::Buffered));
    const EffectRecord child1 = known(kHere, "a", 1), child2 = known(kHere, "b", 2);
    const struct {
        const char *name;
        std::vector<EffectRecord> filed;
        quint32 subId;
        std::size_t size;
        std::size_t ofPath; ///< records, afterwards
    } rows[] = {
        {"nothing known", {}, 0, 1, 1},
        {"the first of the same path", {known(kHere, "a"), known(kHere, "b")}, 0, 2, 2},
        {"the same name, its own file gone", {known(kThere, "a")}, 0, 1, 1},
        {"the same name, its own file there", {known(existing, "a")}, 0, 2, 1},
        {"a child of a shell", {child1, child2}, 2, 2, 2},
        {"a whole shell, beside its children", {child1, child2}, 0, 3, 3},
        {"a child that is not known", {child1}, 3, 2, 2},
        {"a child of a shell that was moved", {known(kThere, "a", 1), known(kThere, "b", 2)}, 2, 2, 2},
        {"a file of several classes that was moved", {known(kThere, "a"), known(kThere, "b")}, 0, 2, 2},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        KnownList list;
        for (const EffectRecord &record : row.filed)
            list.file(record);
        EffectRecord crash = known(kHere, "", row.subId, false);
        crash.fileTime = "2025-01-01 00:00";
        list.applyCrash(crash).id = "crash";
        EXPECT_EQ(list.size(), row.size);
        EXPECT_EQ(list.recordsOfPath(kHere).size(), row.ofPath);
        for (const EffectRecord *record : list.all()) {
            const bool isCulprit = record->id == "crash";
            EXPECT_EQ(record->enabled && record->working, !isCulprit);
            EXPECT_EQ(record->path == kHere && record->subId == row.subId &&
                          record->fileTime == crash.fileTime,
                      isCulprit);
        }
    }
}
