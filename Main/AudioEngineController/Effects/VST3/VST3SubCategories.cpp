#include "Main/AudioEngineController/Effects/VST3/VST3SubCategories.h"

#include "Main/AudioEngineController/Effects/Catalogue/CategoryTable.h"
#include "Main/AudioEngineController/Effects/Catalogue/CategoryWords.h"

namespace {

// Words of Vst::PlugType in the SDK's ivstaudioprocessor.h, and those that plug-ins made up, with the
// browser's category.
constexpr CategoryWord kSubCategories[] = {
    {"Analyzer", "Analysis"},
    {"Channel Strip", "Channel"},
    {"Drum", "Drums"},
    {"Drums", "Drums"},
    {"Filter", "EQ"},
    {"Generator", "Tools"},
    {"Network", "Tools"},
    {"Microphone", "Tools"},
    {"Synth", "Instrument"},
    {"Sampler", "Instrument"},
    {"Piano", "Instrument"},
    {"Pitch Shift", "Pitch"},
    {"Up-Downmix", "Surround"},
    {"Ambisonics", "Ambisonics"},
    {"Bass", "Bass"},
    {"Delay", "Delay"},
    {"Distortion", "Distortion"},
    {"Dynamics", "Dynamics"},
    {"EQ", "EQ"},
    {"Guitar", "Guitar"},
    {"Instrument", "Instrument"},
    {"Mastering", "Mastering"},
    {"Modulation", "Modulation"},
    {"Restoration", "Restoration"},
    {"Reverb", "Reverb"},
    {"Spatial", "Spatial"},
    {"Surround", "Surround"},
    {"Tools", "Tools"},
    {"Vocals", "Vocals"},
};

} // namespace

quint32 categoryFromSubCategories(const QString &subCategories)
{
    static const CategoryWords words(kSubCategories);
    return words.categoryOf(subCategories.split(QLatin1Char('|')));
}

bool isInstrumentCategory(quint32 category)
{
    return (category & CategoryTable::instance().internalBit(CategoryTable::kInstrumentIndex)) != 0;
}
