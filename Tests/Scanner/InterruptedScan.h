#pragma once

#include "Tests/Support/ScanBench.h"

#include <algorithm>

/// Listed modules with the user's marks, all changed since; the scan is disturbed while they are probed.
class InterruptedScan : public ScanBench {
protected:
    explicit InterruptedScan(const QStringList &names = {"A", "B", "C"})
        : m_names(names)
    {
        for (const QString &name : m_names)
            put(name + ".vst3");
        scan();
        for (const QString &name : m_names)
            mark(name, "Favourite", "1");
        m_listed = m_folder.read(cataloguePath());
    }
    /// Updates all, the second one with this script.
    void update(const QByteArray &script) const
    {
        for (const QString &name : m_names)
            dateLater(put(name + ".vst3", name == "B" ? script : QByteArray()));
        forgetTrace();
    }
    /// Makes the requests, one after the other, once the second module is being probed.
    ScannerOutcome interrupt(ScannerRun &scanner, const std::vector<TerminationWay> &ways) const
    {
        if (!scanner.start() || !waitForStage(scanner, "B", "initialize"))
            return {};
        for (const TerminationWay &way : ways)
            scanner.requestTermination(way);
        return scanner.wait();
    }
    /// The modules whose records hold their new time stamp. All must be there with their marks, and work.
    QStringList renewed() const
    {
        QStringList names, listed;
        for (const QString &row : sortedRecords("Name FileTime Favourite Enabled Working")) {
            const QString name = row.section('|', 0, 0);
            EXPECT_TRUE(row.endsWith("|1|1|1")) << qPrintable(row);
            listed.append(name);
            if (row.contains("|2022-"))
                names.append(name);
        }
        EXPECT_EQ(listed, m_names);
        const QStringList ids = records("ID");
        EXPECT_TRUE(std::is_sorted(ids.begin(), ids.end())) << qPrintable(ids.join(' '));
        return names;
    }

    const QStringList m_names;
    QByteArray m_listed; ///< the catalogue before the updates
};
