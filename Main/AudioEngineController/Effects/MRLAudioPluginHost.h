#pragma once

#include "Main/AudioEngineController/Effects/AudioPluginHost.h"

/// The host of the maker's built-in effects. Its file holds only the user's marks on them. The effects
/// themselves come from the application; the scanner has none and leaves the file alone, so that no mark is
/// lost.
class MRLAudioPluginHost : public AudioPluginHost {
public:
    MRLAudioPluginHost();

    /// The built-in effects of this application, by identifier.
    void setBuiltInEffects(const std::vector<EffectRecord> &effects);

    /// Reads the marks and sets them on the effects. Marks on effects that this application does not have are
    /// skipped.
    void ReadCatalogue() override;
    /// Nothing to scan: the effects are what the application says.
    bool Scan(bool scan, bool inProcess) override;
};

/// The file of the marks on built-in effects.
const CatalogueFormat &builtInEffectsFormat();
