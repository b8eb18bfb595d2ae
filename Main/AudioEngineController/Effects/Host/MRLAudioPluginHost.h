#pragma once

#include "Main/AudioEngineController/Effects/Host/CatalogueHost.h"

/// The host of the maker's built-in effects. Its file holds only the user's marks on them. The effects
/// themselves come from the application; the scanner has none and never writes the file, so that no mark is
/// lost.
class MRLAudioPluginHost : public CatalogueHost {
public:
    MRLAudioPluginHost();

    /// The built-in effects of this application, by identifier (without the prefix of the format, as in every
    /// catalogue). They take their marks from the file.
    void setBuiltInEffects(const std::vector<EffectRecord> &effects);

    /// Reads the marks and sets them on the effects. Each mark on an effect that this application does not
    /// have is passed over with a log line: the next writing loses it.
    void ReadCatalogue() override;
    /// Nothing to scan: the effects are what the application says.
    bool Scan(bool scan, bool inProcess) override;

    /// Sets the user's mark on an effect and writes the file. False when there is no such effect or the file
    /// was not written.
    bool setFavourite(const QString &id, bool favourite);
    /// Writes the marks of all effects; false in the scanner and, which is logged, where that fails or there
    /// are no effects, for an empty file would lose the marks.
    bool writeMarks();
};
