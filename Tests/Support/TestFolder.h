#pragma once

#include "Tests/Support/QtPrinters.h"

#include <QByteArray>
#include <QDateTime>
#include <QString>
#include <QStringList>
#include <QTemporaryDir>

/// A workstation's data folder for one test, removed with it: "Effects" for the catalogue, "Plugins" for the
/// plug-ins. Paths given to its operations are full or start from the data folder. An operation that fails
/// fails the test.
class TestFolder {
public:
    TestFolder();
    TestFolder(const TestFolder &) = delete;
    TestFolder &operator=(const TestFolder &) = delete;

    /// The full path of something in the data folder.
    QString path(const QString &name) const;
    QString dataFolder() const { return m_folder.path(); }
    QString effects() const { return path("Effects"); }
    QString plugins() const { return path("Plugins"); }
    QString scanList() const { return path("Effects/FXScan.xml"); }

    /// Writes a file, with the folders that it needs.
    void write(const QString &file, const QByteArray &content) const;
    /// A file's content; empty where there is none.
    QByteArray read(const QString &file) const;
    /// A file's lines without their ends; empty where there is none.
    QStringList lines(const QString &file) const;

    /// Writes the scan list of these folders; without any, of "Plugins".
    void writeScanList(QStringList folders = {}) const;
    /// The text of a catalogue file in "Effects".
    QByteArray catalogue(const QString &name = "VST3Configuration.xml") const;
    /// The file names of the crash markers in "Effects", sorted.
    QStringList markers() const;

    /// Gives a file another modification time.
    void setModified(const QString &file, const QDateTime &time) const;

private:
    QTemporaryDir m_folder;
};
