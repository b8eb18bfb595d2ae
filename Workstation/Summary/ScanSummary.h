#pragma once

#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"
#include "Workstation/Summary/CatalogueView.h"
#include "Workstation/Summary/Duplicates.h"
#include "Workstation/Summary/ScanAccount.h"
#include "Workstation/Summary/ScanTimeline.h"

/// A plug-in, or a file that was taken for one, that cannot be used.
struct PluginFailure {
    const PluginFormatInfo *format;
    PluginState state;
    QString name;
    QString path;
    quint32 subId;
    QString reason;          ///< one phrase, without a full stop
    bool isCatalogued;       ///< it is one of the catalogue's plug-ins, too
    bool hasChanged = false; ///< see `CataloguedPlugin`
};

/// A file and the time that its probe took.
struct ProbeTime {
    QString path;
    double milliseconds;
};

/// What fxscan has to tell when a scan is over, or about a catalogue as it is.
struct ScanSummary {
    std::vector<CataloguedPlugin> plugins;
    std::vector<PluginFailure> failures;
    std::vector<PluginFailure> noPlugins; ///< files that look like plug-ins and are not
    QStringList problems;                 ///< one sentence each
    std::vector<Duplicate> duplicates;    ///< by name
    std::vector<ProbeTime> slowest;       ///< the slowest first
    ScanTimeline timeline;
    QStringList removed; ///< names of what is gone
    QStringList skipped; ///< paths that the user passed over in this scan
    std::size_t all = 0; ///< what `countOf` gave when only some are shown; 0: all are
    int added = 0;
    int updated = 0; ///< were known and probed again
    int unchanged = 0;
    bool isScan = false;   ///< false: nothing was scanned, the counts above mean nothing
    bool finished = false; ///< the scan came to its end
};

/// Plug-ins, and files that failed and have no record. What the user skipped says nothing about itself.
std::size_t countOf(const ScanSummary &summary);

/// Leaves only these of the plug-ins, and of what belongs to plug-ins what belongs to these. Files without a
/// record stay where `isFileShown` says so.
void keepPlugins(ScanSummary &summary, std::vector<CataloguedPlugin> plugins,
                 const std::function<bool(const PluginFailure &)> &isFileShown);

/// What the catalogue says. `memory` gives the reasons of earlier probes.
ScanSummary summariseCatalogue(CatalogueView now, const ProbeMemory &memory);
/// The same after a scan: `before` is the catalogue as the scan found it.
ScanSummary summariseScan(CatalogueView now, const CatalogueView &before, const ScanAccount &account,
                          const ProbeMemory &memory);
