#include "Tests/Support/FixtureFile.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <gtest/gtest.h>

void putFixture(const QString &source, const QString &path, const QByteArray &script)
{
    QFile scriptFile(path + ".script");
    QDir().mkpath(QFileInfo(path).path());
    QFile::remove(path);
    scriptFile.remove();
    EXPECT_TRUE(QFile::copy(source, path)) << qPrintable(source) << " to " << qPrintable(path);
    if (script.isNull())
        return;
    const bool written = scriptFile.open(QIODevice::WriteOnly) && scriptFile.write(script) == script.size();
    EXPECT_TRUE(written) << qPrintable(scriptFile.errorString());
}
