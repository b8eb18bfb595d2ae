#include "Core/BaseLib/Files/TextFile.h"
#include "Tests/Fuzz/FuzzTarget.h"

#include <QDir>

#include <gtest/gtest.h>

TEST(FuzzCorpus, BreaksNoRule)
{
    const FuzzFolder working;
    for (const FuzzTarget &target : kFuzzTargets) {
        const QDir folder(QStringLiteral(FXPROBE_FUZZ_CORPUS "/") + QLatin1String(target.name));
        const QStringList files = folder.entryList(QDir::Files);
        EXPECT_FALSE(files.isEmpty()) << target.name << " has no corpus";
        for (const QString &file : files) {
            QByteArray input;
            ASSERT_TRUE(bool(readWholeFile(folder.filePath(file), input))) << file.toStdString();
            EXPECT_NO_THROW(target.run(input)) << target.name << ": " << file.toStdString();
        }
    }
}
