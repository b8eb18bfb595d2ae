#pragma once

#include "Tests/Support/ScannerRun.h"
#include "Tests/Support/TestFolder.h"
#include "Tests/Support/VST3Fixture.h"

#include <gtest/gtest.h>

#include <initializer_list>
#include <vector>

/// UTF-8 texts as Qt ones, for tables.
QStringList texts(std::initializer_list<const char *> utf8);

/// A data folder with scripted modules, and the real scanner on it. Modules are dated, so that no test
/// depends on the minute in which it runs, and write their calls to one trace.
class VST3ScanBench : public testing::Test {
protected:
    VST3ScanBench() { m_folder.writeScanList(); }

    /// Puts a module into "Plugins", or into a folder below it when the name has one ("sub/Comp"). Without a
    /// script it has one healthy class of its own name. Returns its full path.
    QString add(const QString &name, const QByteArray &script = {},
                VST3Fixture fixture = VST3Fixture::Scripted) const;
    /// Replaces a module by one of a later date.
    void update(const QString &name, const QByteArray &script = {}) const;
    /// Puts something that is no module of ours under a module's name.
    QString addRaw(const QString &name, const QByteArray &content) const;
    QString modulePath(const QString &name) const;

    /// One run, which must end by itself with 0 and leave no marker.
    ScannerOutcome scan() const;
    /// One run that may end as it likes.
    ScannerOutcome scanOnce() const;
    /// Runs until no marker survives; gives the number of runs.
    int scanUntilSettled() const;

    /// The calls of the last run, "NAME CALL" with the module's name.
    QStringList trace() const { return m_folder.lines(QStringLiteral("trace")); }
    /// The calls of one module in the last run.
    QStringList traceOf(const QString &name) const;
    /// The modules that the last run loaded, in order.
    QStringList loaded() const;

    /// The catalogue's records in their order, each as the values of some elements, "A|B|C". The text is
    /// taken as it is, so that what no XML reader takes can be looked at too.
    QStringList records(const char *elements) const;
    /// The same, sorted.
    QStringList sortedRecords(const char *elements) const;
    /// What the workstation does when the user marks a plug-in: changes one element of the record with the
    /// name.
    void mark(const QString &name, const char *element, const QByteArray &value) const;

    TestFolder m_folder;
};
