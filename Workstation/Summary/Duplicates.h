#pragma once

#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"
#include "Workstation/Summary/CatalogueView.h"

/// One of several that are the same plug-in for a user.
struct DuplicateMember {
    const PluginFormatInfo *format;
    QString path;
    bool isUsed; ///< the workstation offers it
    QString why; ///< why not, in a word or two; empty when it does
};

/// A plug-in that is there more than once.
struct Duplicate {
    QString name;
    QString vendor;
    std::vector<DuplicateMember> members; ///< those that are used first, then in the order of the formats

    /// True when the members differ in nothing but their format, and all are used.
    bool isOneOfEachFormat() const;
};

/// Plug-ins of one name and vendor in several formats or files, and files whose plug-ins others hold: copies,
/// which no catalogue lists.
std::vector<Duplicate> findDuplicates(const std::vector<CataloguedPlugin> &plugins,
                                      const ProbeMemory &memory);
