#pragma once

#include "Tests/Support/ScannerRun.h"
#include "Tests/Support/TestFolder.h"

#include <gtest/gtest.h>

#include <initializer_list>
#include <map>

/// UTF-8 texts as Qt ones, for tables.
QStringList texts(std::initializer_list<const char *> utf8);

/// A data folder with scripted plug-ins, and the real scanner on it. Modules are dated, so that no test
/// depends on the minute in which it runs, and write their calls to one trace.
class ScanBench : public testing::Test {
protected:
    /// `catalogue` is the file that `records` looks at, `ending` that of a module's name.
    explicit ScanBench(const char *catalogue = "VST3Configuration.xml", const QString &ending = ".vst3");

    /// The program under test.
    static QString scannerProgram();
    /// The script's first statement: where a module's calls go, under its name.
    QByteArray traceStatement(const QString &name) const;
    /// Puts a module into "Plugins", or into a folder below it when the file has one ("sub/Comp.vst3"); the
    /// ending ".vst2" is spelt as the system spells it. A VST 3 script without classes gets one of the file's
    /// name. Returns the module's full path.
    QString put(const QString &file, const QByteArray &script = {}) const;
    /// Dates a file as plug-ins of the first scan are, and gives its path back.
    QString dateFirst(const QString &path) const;
    /// Dates it as their updates are.
    void dateLater(const QString &path) const;
    QString modulePath(const QString &name) const { return m_folder.plugins() + '/' + name + m_ending; }

    /// One run, which must end by itself with 0 and leave no marker.
    ScannerOutcome scan() const;
    /// One run that may end as it likes, with these variables in its environment, or without those that are
    /// null.
    ScannerOutcome scanOnce(const std::map<QString, QString> &environment = {}) const;
    /// Runs until no marker survives; gives the number of runs.
    int scanUntilSettled() const;
    /// A run in which everything is known: it must load nothing and leave the catalogue as it is.
    void expectSettled() const;

    /// The calls since the last run began, "NAME CALL" with the module's name.
    QStringList trace() const { return m_folder.lines("trace"); }
    void forgetTrace() const { m_folder.write("trace", {}); }
    /// The calls of one module.
    QStringList traceOf(const QString &name) const;
    /// The modules that were loaded, in order.
    QStringList loaded() const;
    /// Waits until a module has got as far as a stage of its trace.
    bool waitForStage(ScannerRun &scanner, const QString &module, const QString &stage) const;

    QString cataloguePath() const { return m_folder.effects() + '/' + m_catalogue; }
    /// The catalogue's records in their order, each as the values of some elements, "A|B|C". The text is
    /// taken as it is, so that what no XML reader takes can be looked at too.
    QStringList records(const char *elements) const { return recordsOf(m_catalogue, elements); }
    QStringList recordsOf(const QString &file, const char *elements) const;
    QStringList sortedRecords(const char *elements) const;
    /// What the workstation does when the user marks a plug-in: changes one element of the record with the
    /// name, in whatever catalogue has one.
    void mark(const QString &name, const char *element, const QByteArray &value) const;
    /// Everything in the "Effects" folder and below, with the files' contents.
    std::map<QString, QByteArray> effectsFolder() const;

    TestFolder m_folder;

private:
    QString m_catalogue, m_ending;
};
