#pragma once

#include "Tests/Main/AudioEngineController/Effects/Host/ScanBench.h"
#include "Tests/Support/VST3Fixture.h"

#include <QFileInfo>

/// The bench with VST 3 modules on it.
class VST3ScanBench : public ScanBench {
protected:
    VST3ScanBench()
        : ScanBench("VST3Configuration.xml", ".vst3")
    {}

    /// Puts a module into "Plugins", or into a folder below it when the name has one ("sub/Comp"). Without a
    /// script it has one healthy class of its own name. Returns its full path.
    QString add(const QString &name, const QByteArray &script = {},
                VST3Fixture fixture = VST3Fixture::Scripted) const
    {
        const QByteArray label = QFileInfo(name).fileName().toUtf8();
        const QByteArray classes = script.isNull() ? "class \"" + label + "\"\n" : script;
        return dateFirst(addVST3File(m_folder.plugins(), name, traceStatement(name) + classes, fixture));
    }
    /// Replaces a module by one of a later date.
    void update(const QString &name, const QByteArray &script = {}) const { dateLater(add(name, script)); }
};
