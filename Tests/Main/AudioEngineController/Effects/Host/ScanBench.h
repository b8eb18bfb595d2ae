#pragma once

#include "Tests/Support/ScannerRun.h"
#include "Tests/Support/TestFolder.h"

#include <gtest/gtest.h>

#include <initializer_list>
#include <vector>

/// UTF-8 texts as Qt ones, for tables.
QStringList texts(std::initializer_list<const char *> utf8);

/// A data folder with scripted plug-ins, and the real scanner on it. Modules are dated, so that no test
/// depends on the minute in which it runs, and write their calls to one trace.
class ScanBench : public testing::Test {
protected:
    /// `catalogue` is the file that `records` and `mark` look at, `ending` that of a module's name.
    ScanBench(const char *catalogue, const QString &ending);

    /// The script's first statement: where a module's calls go, under its name.
    QByteArray traceStatement(const QString &name) const;
    /// Dates a file as plug-ins of the first scan are, and gives its path back.
    QString dateFirst(const QString &path) const;
    /// Dates it as their updates are.
    void dateLater(const QString &path) const
    {
        m_folder.setModified(path, QDateTime({2022, 3, 4}, {5, 6, 7}));
    }
    QString modulePath(const QString &name) const { return m_folder.plugins() + '/' + name + m_ending; }
    /// Puts something that is no module of ours under a module's name; returns its path.
    QString addRaw(const QString &name, const QByteArray &content) const;

    /// One run, which must end by itself with 0 and leave no marker.
    ScannerOutcome scan() const;
    /// One run that may end as it likes.
    ScannerOutcome scanOnce() const;
    /// Runs until no marker survives; gives the number of runs.
    int scanUntilSettled() const;
    /// A run in which everything is known: it must load nothing and leave the catalogue as it is.
    void expectSettled() const;

    /// The calls of the last run, "NAME CALL" with the module's name.
    QStringList trace() const { return m_folder.lines("trace"); }
    /// The calls of one module in the last run.
    QStringList traceOf(const QString &name) const;
    /// The modules that the last run loaded, in order.
    QStringList loaded() const;

    /// The catalogue's records in their order, each as the values of some elements, "A|B|C". The text is
    /// taken as it is, so that what no XML reader takes can be looked at too.
    QStringList records(const char *elements) const { return recordsOf(m_catalogue, elements); }
    QStringList recordsOf(const QString &file, const char *elements) const;
    /// The same, sorted.
    QStringList sortedRecords(const char *elements) const;
    /// What the workstation does when the user marks a plug-in: changes one element of the record with the
    /// name.
    void mark(const QString &name, const char *element, const QByteArray &value) const;

    TestFolder m_folder;

private:
    QString m_catalogue, m_ending;
};
