#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Tests/Support/ScannerRun.h"
#include "Tests/Support/TestFolder.h"
#include "Tests/Support/VST3Fixture.h"

#include <gtest/gtest.h>

#include <map>

/// The program under test.
QString scannerProgram();
/// The platform's usual ends of lines in a text written with "\n".
QByteArray textLines(QByteArray text);
/// The lines of a log without their time stamps and without the line that ends every scan.
QStringList logLines(const ScannerOutcome &outcome);

/// A data folder, a scan list that names its "Plugins", and modules there that keep a common trace.
class ScannerTest : public testing::Test {
protected:
    ScannerTest();

    /// Adds a module that traces its calls under its own name; returns its path.
    QString addModule(const QString &name, const QByteArray &script = {}) const;
    /// Adds the modules and lists them in a first run, dated `listedTime()`.
    void addListedModules(const QStringList &names);
    /// Gives modules another time stamp, so that the next run probes them, and forgets the trace.
    void touchModules(const QStringList &names) const;
    /// Changes the catalogue's text.
    void editCatalogue(const char *from, const char *to) const;
    static QDateTime listedTime() { return {QDate(2020, 1, 2), QTime(3, 4)}; }
    static QDateTime touchedTime() { return {QDate(2021, 5, 6), QTime(7, 8)}; }

    /// A whole run, with these variables in its environment, or without those that are null.
    ScannerOutcome run(const std::map<QString, QString> &environment = {}) const;
    QString tracePath() const { return m_folder.path("trace"); }
    QStringList trace() const { return m_folder.lines(tracePath()); }
    void forgetTrace() const { m_folder.write(tracePath(), {}); }
    /// The names of the modules that were loaded, in the order of loading.
    QStringList loaded() const;
    /// Waits until a module has got as far as a stage of its trace.
    bool waitForStage(ScannerRun &scanner, const QString &module, const QString &stage) const;

    QString cataloguePath() const { return m_folder.effects() + "/VST3Configuration.xml"; }
    /// The catalogue's records by module name; the test fails when the file is not complete.
    std::map<QString, EffectRecord> records() const;
    /// The names of the listed modules, sorted.
    QStringList listed() const;
    /// Everything in the "Effects" folder and below, with the files' contents.
    std::map<QString, QByteArray> effectsFolder() const;

    TestFolder m_folder;
};
