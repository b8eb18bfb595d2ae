#pragma once

#include "Tests/Main/AudioEngineController/Effects/Host/ScanBench.h"
#include "Tests/Support/VST2Fixture.h"

/// The bench with VST 2 modules on it.
class VSTScanBench : public ScanBench {
protected:
    VSTScanBench()
        : ScanBench("FXConfiguration.xml", vst2Ending())
    {}

    /// Puts a module into "Plugins", or into a folder below it when the name has one ("sub/Comp"). Returns
    /// its full path.
    QString add(const QString &name, const QByteArray &script = {},
                VST2Fixture fixture = VST2Fixture::Scripted) const
    {
        return dateFirst(addVST2File(m_folder.plugins(), name, traceStatement(name) + script, fixture));
    }
    /// Replaces a module by one of a later date.
    void update(const QString &name, const QByteArray &script = {}) const { dateLater(add(name, script)); }
};
