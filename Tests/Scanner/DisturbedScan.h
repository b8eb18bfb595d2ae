#pragma once

#include "Tests/Scanner/ScannerTest.h"

#include <set>

/// A dozen listed favourites that changed since, one of them switched off; scans of them are disturbed.
class DisturbedScan : public ScannerTest {
protected:
    explicit DisturbedScan(const QByteArray &script = {});
    /// The modules that surviving markers name.
    std::set<QString> namedByMarkers() const;
    /// Runs until no marker survives. Everything must be listed then, with the user's marks, and whatever was
    /// not `named` must be as it was.
    void expectSettled(const std::set<QString> &named) const;

    static QString switchedOff() { return "M03"; }
    QStringList m_names;
};
