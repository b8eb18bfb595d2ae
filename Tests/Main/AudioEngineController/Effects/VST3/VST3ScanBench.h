#pragma once

#include "Tests/Main/AudioEngineController/Effects/ScanBench.h"
#include "Tests/Support/VST3Fixture.h"

/// The bench with VST 3 modules on it.
class VST3ScanBench : public ScanBench {
protected:
    VST3ScanBench()
        : ScanBench("VST3Configuration.xml")
    {}

    /// Puts a module into "Plugins", or into a folder below it when the name has one ("sub/Comp"). Without a
    /// script it has one healthy class of its own name. Returns its full path.
    QString add(const QString &name, const QByteArray &script = {},
                VST3Fixture fixture = VST3Fixture::Scripted) const;
    /// Replaces a module by one of a later date.
    void update(const QString &name, const QByteArray &script = {}) const;
    /// Puts something that is no module of ours under a module's name.
    QString addRaw(const QString &name, const QByteArray &content) const;
    QString modulePath(const QString &name) const;
};
