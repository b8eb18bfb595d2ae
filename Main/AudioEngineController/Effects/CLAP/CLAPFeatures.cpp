#include "Main/AudioEngineController/Effects/CLAP/CLAPFeatures.h"

#include "Main/AudioEngineController/Effects/CLAP/CLAPInterface.h"
#include "Main/AudioEngineController/Effects/CLAP/CLAPText.h"
#include "Main/AudioEngineController/Effects/Catalogue/CategoryWords.h"

namespace {

/// More features than any plug-in has; what a plug-in lists beyond is not read.
constexpr int kMaxFeatures = 256;

constexpr CategoryWord kFeatures[] = {
    {CLAP_PLUGIN_FEATURE_INSTRUMENT, "Instrument"},
    {CLAP_PLUGIN_FEATURE_SYNTHESIZER, "Instrument"},
    {CLAP_PLUGIN_FEATURE_SAMPLER, "Instrument"},
    {CLAP_PLUGIN_FEATURE_DRUM, "Drums"},
    {CLAP_PLUGIN_FEATURE_DRUM_MACHINE, "Drums"},
    {CLAP_PLUGIN_FEATURE_ANALYZER, "Analysis"},
    {CLAP_PLUGIN_FEATURE_FILTER, "EQ"},
    {CLAP_PLUGIN_FEATURE_EQUALIZER, "EQ"},
    {CLAP_PLUGIN_FEATURE_PHASER, "Modulation"},
    {CLAP_PLUGIN_FEATURE_FLANGER, "Modulation"},
    {CLAP_PLUGIN_FEATURE_CHORUS, "Modulation"},
    {CLAP_PLUGIN_FEATURE_TREMOLO, "Modulation"},
    {CLAP_PLUGIN_FEATURE_PHASE_VOCODER, "Pitch"},
    {CLAP_PLUGIN_FEATURE_FREQUENCY_SHIFTER, "Pitch"},
    {CLAP_PLUGIN_FEATURE_PITCH_SHIFTER, "Pitch"},
    {CLAP_PLUGIN_FEATURE_PITCH_CORRECTION, "Pitch"},
    {CLAP_PLUGIN_FEATURE_DEESSER, "Dynamics"},
    {CLAP_PLUGIN_FEATURE_TRANSIENT_SHAPER, "Dynamics"},
    {CLAP_PLUGIN_FEATURE_COMPRESSOR, "Dynamics"},
    {CLAP_PLUGIN_FEATURE_LIMITER, "Dynamics"},
    {CLAP_PLUGIN_FEATURE_DISTORTION, "Distortion"},
    {CLAP_PLUGIN_FEATURE_DELAY, "Delay"},
    {CLAP_PLUGIN_FEATURE_REVERB, "Reverb"},
    {CLAP_PLUGIN_FEATURE_UTILITY, "Tools"},
    {CLAP_PLUGIN_FEATURE_RESTORATION, "Restoration"},
    {CLAP_PLUGIN_FEATURE_MULTI_EFFECTS, "Multi Effect"},
    {CLAP_PLUGIN_FEATURE_MIXING, "Channel"},
    {CLAP_PLUGIN_FEATURE_MASTERING, "Mastering"},
    {CLAP_PLUGIN_FEATURE_SURROUND, "Surround"},
    {CLAP_PLUGIN_FEATURE_AMBISONIC, "Ambisonics"},
};

} // namespace

QStringList clapFeatures(const char *const *features)
{
    QStringList texts;
    std::size_t length = 0; // with a bar behind each
    for (int index = 0; features && index < kMaxFeatures && features[index]; ++index) {
        QString text = clapText(features[index]);
        length += static_cast<std::size_t>(text.size()) + 1;
        if (length > kMaxClapText + 1)
            break;
        texts.append(text.replace(QLatin1Char('|'), QLatin1Char('/'))); // bars come between them
    }
    return texts;
}

quint32 categoryFromFeatures(const QStringList &features)
{
    static const CategoryWords words(kFeatures);
    return words.categoryOf(features);
}
