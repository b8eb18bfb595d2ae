#pragma once

#include "Tests/Scanner/ScannerTest.h"

inline const QStringList kThree{"A", "B", "C"};

/// Three listed modules with the user's marks, all changed since; the scan is disturbed while one is probed.
class InterruptedProbe : public ScannerTest {
protected:
    InterruptedProbe()
    {
        addListedModules(kThree);
        editCatalogue("<Favourite>0<", "<Favourite>1<");
        editCatalogue("<CategoryMask>0<", "<CategoryMask>16<");
    }
    void slowDown(const QByteArray &script, const QString &module = "B") const
    {
        addModule(module, script);
        touchModules(kThree);
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
    /// The modules whose records hold their new time stamp; all three must be there with their marks, and
    /// all but the culprit working.
    QStringList renewed(const QString &culprit = {}) const
    {
        QStringList names;
        EXPECT_EQ(listed(), kThree);
        for (const auto &[name, record] : records()) {
            EXPECT_TRUE(record.favourite && record.category != 0) << qPrintable(name);
            EXPECT_TRUE(record.enabled == record.working && record.working == (name != culprit))
                << qPrintable(name);
            if (record.fileTime == "2021-05-06 07:08")
                names.append(name);
        }
        return names;
    }
};
