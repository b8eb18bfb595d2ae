#pragma once

#include "Tests/Support/ScannerRun.h"
#include "Tests/Support/TestFolder.h"

#include <gtest/gtest.h>

#include <map>

/// A data folder with scripted plug-ins, and the real scanner on it. Modules are dated, so that no test
/// depends on the minute in which it runs, and write their calls to one trace.
class ScanBench : public testing::Test {
protected:
    ScanBench() { m_folder.writeScanList(); }

    /// Whether plug-ins are asked by workers: a killer ends one of them, not the scanner.
    static bool hasWorkers() { return qEnvironmentVariableIsSet("FXPROBE_JOBS"); }
    /// The program under test.
    static QString scannerProgram();
    /// Puts a module into "Plugins", or into a folder below it when the file has one ("sub/Comp.vst3"); the
    /// ending ".vst2" is spelt as the system spells it, and ".bundle" makes a VST 3 bundle. A VST 3 or CLAP
    /// script without classes gets one of the file's name. Returns the module's full path.
    QString put(const QString &file, const QByteArray &script = {}) const;
    /// Dates a file as plug-ins of the first scan are, and gives its path back.
    QString dateFirst(const QString &path) const;
    /// Dates it as their updates are.
    void dateLater(const QString &path) const;

    /// One run, which must end by itself with 0 and leave no marker.
    ScannerOutcome scan() const;
    /// One run that may end as it likes, with these variables in its environment, or without those that are
    /// null.
    ScannerOutcome scanOnce(const std::map<QString, QString> &environment = {}) const;
    /// Runs until no marker survives; gives the number of runs.
    int scanUntilSettled() const;

    /// The calls since the last run began, "NAME CALL" with the module's name.
    QStringList trace() const { return m_folder.lines("trace"); }
    void forgetTrace() const { m_folder.write("trace", {}); }
    /// The calls of one module.
    QStringList traceOf(const QString &name) const;
    /// The modules that were loaded, in order.
    QStringList loaded() const;
    /// Waits until a module has got as far as a stage of its trace.
    bool waitForStage(ScannerRun &scanner, const QString &module, const QString &stage) const;

    QString cataloguePath() const { return m_folder.path("Effects/VST3Configuration.xml"); }
    /// A catalogue's records in their order, each as the values of some elements, "A|B|C". The text is taken
    /// as it is, so that what no XML reader takes can be looked at too.
    QStringList recordsOf(const QString &file, const char *elements) const;
    /// Those of VST 3.
    QStringList records(const char *elements) const { return recordsOf("VST3Configuration.xml", elements); }
    QStringList sortedRecords(const char *elements) const;
    /// What the workstation does when the user marks a plug-in: changes one element of the record with the
    /// name, in whatever catalogue has one.
    void mark(const QString &name, const char *element, const QByteArray &value) const;
    /// Everything in the "Effects" folder and below, with the files' contents.
    std::map<QString, QByteArray> effectsFolder() const;

    TestFolder m_folder;
};
