#pragma once

#include "Workstation/Library/ScanRun.h"
#include "Workstation/Options/ScanOptions.h"
#include "Workstation/Output/JsonLines.h"
#include "Workstation/Output/Progress.h"
#include "Workstation/Output/TerminalKeys.h"

#include <QElapsedTimer>

#include <optional>

/// One scan from the command line: shows how it gets on, and ends it when somebody asks.
class ScanSession : public ScanRun {
public:
    /// `report` is the file that the scanner reports to; `lines` gets what comes to pass.
    ScanSession(const ScanOptions &options, PluginHost &registry, const QString &report, JsonLines &lines);

    /// As `ScanRun` does, and takes the line of the progress away.
    bool run();

protected:
    void wait() override;
    void show(ScanAccount &account) override;
    void culpritFound(const ScanCulprit &culprit) override;
    void scanOnce() override;

private:
    void cancelForUser();
    void skip();
    void takeKeys();
    void endOverdueProbe();

    const ScanOptions &m_options;
    std::optional<TerminalKeys> m_keys; ///< none where a plug-in could end us before the terminal is put back
    Progress m_progress;
    JsonLines &m_lines;
    QElapsedTimer m_sinceCancel;
};
