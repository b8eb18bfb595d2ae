#include "Tests/Support/TestFolder.h"

#include "Core/BaseLib/Files/TextFile.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <gtest/gtest.h>

TestFolder::TestFolder()
    : m_folder(QDir::temp().filePath("fxprobe-test-XXXXXX"))
{
    const bool made =
        m_folder.isValid() && QDir(dataFolder()).mkpath(effects()) && QDir(dataFolder()).mkpath(plugins());
    EXPECT_TRUE(made) << qPrintable(m_folder.errorString());
}

QString TestFolder::path(const QString &name) const { return QDir(dataFolder()).filePath(name); }

void TestFolder::write(const QString &file, const QByteArray &content) const
{
    const QString fullPath = path(file);
    QDir().mkpath(QFileInfo(fullPath).path());
    QFile target(fullPath);
    const bool written = target.open(QIODevice::WriteOnly | QIODevice::Truncate) &&
                         target.write(content) == content.size() && target.flush();
    EXPECT_TRUE(written) << qPrintable(fullPath) << ": " << qPrintable(target.errorString());
}

QByteArray TestFolder::read(const QString &file) const
{
    QFile source(path(file));
    return source.open(QIODevice::ReadOnly) ? source.readAll() : QByteArray();
}

QStringList TestFolder::lines(const QString &file) const
{
    QString text = QString::fromUtf8(read(file)).remove('\r');
    if (text.endsWith('\n'))
        text.chop(1);
    return text.isEmpty() ? QStringList() : text.split('\n');
}

void TestFolder::writeScanList(QStringList folders) const
{
    if (folders.isEmpty())
        folders.append(plugins());
    QByteArray content = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<Scan>\n";
    for (const QString &folder : folders)
        content += "\t<Path>" + folder.toUtf8() + "</Path>\n";
    write(scanList(), content.replace("\n", kLineEnd) + "</Scan>" + kLineEnd);
}

QByteArray TestFolder::catalogue(const QString &name) const { return read(effects() + '/' + name); }

QStringList TestFolder::markers() const
{
    return QDir(effects()).entryList({"*.scan*"}, QDir::Files | QDir::Hidden, QDir::Name);
}

void TestFolder::setModified(const QString &file, const QDateTime &time) const
{
    QFile target(path(file));
    const bool set = target.open(QIODevice::ReadWrite | QIODevice::ExistingOnly) &&
                     target.setFileTime(time, QFileDevice::FileModificationTime);
    EXPECT_TRUE(set) << qPrintable(path(file)) << ": " << qPrintable(target.errorString());
}
