#pragma once

#include "Tests/Scanner/ScannerTest.h"

inline const QStringList kThree{QStringLiteral("A"), QStringLiteral("B"), QStringLiteral("C")};

/// Three listed favourites that changed since; a request comes while the second one is being probed.
class InterruptedProbe : public ScannerTest {
protected:
    InterruptedProbe()
    {
        addListedModules(kThree);
        editCatalogue("<Favourite>0<", "<Favourite>1<");
    }
    void slowDown(const QByteArray &script) const
    {
        addModule(QStringLiteral("B"), script);
        touchModules(kThree);
    }
    /// Makes the requests, one after the other, once the second module is being probed.
    ScannerOutcome interrupt(ScannerRun &scanner, const std::vector<TerminationWay> &ways) const
    {
        if (!scanner.start() || !waitForStage(scanner, QStringLiteral("B"), QStringLiteral("initialize")))
            return {};
        for (const TerminationWay &way : ways)
            scanner.requestTermination(way);
        return scanner.wait();
    }
    /// The modules whose records hold their new time stamp; all three must be there with their marks.
    QStringList renewed() const
    {
        QStringList names;
        EXPECT_EQ(listed(), kThree);
        for (const auto &[name, record] : records()) {
            EXPECT_TRUE(record.favourite && record.enabled && record.working) << qPrintable(name);
            if (record.fileTime == QStringLiteral("2021-05-06 07:08"))
                names.append(name);
        }
        return names;
    }
};
