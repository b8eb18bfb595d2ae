#pragma once

#include "Main/AudioEngineController/Effects/Host/ScanPlan.h"

#include <utility>
#include <vector>

/// What a catalogue keeps of one outcome: records, with the marks that they take over.
struct OutcomeRecords {
    std::vector<EffectRecord> listed; ///< in the outcome's order
    std::vector<EffectRecord> kept;   ///< what the file had before, unless another comes to list it
    /// What crash markers would say. The known list takes it over: what is kept afterwards is decided as if
    /// the next run had read them.
    std::vector<EffectRecord> crashes;
    /// Identifiers of listed ones, and the old records whose marks they get unless another file lists those.
    std::vector<std::pair<QString, const EffectRecord *>> likelyMarks;

    /// True when one of the listed or kept ones has the identifier.
    bool holds(const QString &id) const;
};

/// The records of an item of the plan when its probe came to this. Changes nothing; the order in which
/// outcomes are kept decides which of two records gets an identifier.
OutcomeRecords recordsOfOutcome(const CatalogueHost &host, const ScanPlan &plan, const ScanItem &item,
                                const ProbeOutcome &outcome);
