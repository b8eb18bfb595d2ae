#pragma once

#include "Tests/Main/AudioEngineController/Effects/ScanBench.h"
#include "Tests/Support/VST2Fixture.h"

/// The bench with VST 2 modules on it, and VST 3 ones beside them where a test needs both.
class VSTScanBench : public ScanBench {
protected:
    VSTScanBench()
        : ScanBench("FXConfiguration.xml")
    {}

    /// Puts a module into "Plugins", or into a folder below it when the name has one ("sub/Comp"). Returns
    /// its full path.
    QString add(const QString &name, const QByteArray &script = {},
                VST2Fixture fixture = VST2Fixture::Scripted) const;
    /// Replaces a module by one of a later date.
    void update(const QString &name, const QByteArray &script = {}) const;
    /// Puts something that is no module of ours under a module's name.
    QString addRaw(const QString &name, const QByteArray &content) const;
    QString modulePath(const QString &name) const;
    /// Puts a VST 3 module with one class of its name beside them.
    void addVST3(const QString &name, const QByteArray &script) const;
};
