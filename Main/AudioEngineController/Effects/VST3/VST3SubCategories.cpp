#include "Main/AudioEngineController/Effects/VST3/VST3SubCategories.h"

#include "Main/AudioEngineController/Effects/Catalogue/CategoryTable.h"

#include <QStringList>

#include <map>

namespace {

struct SubCategory {
    const char *word;
    const char *category;
};

// Words of Vst::PlugType in the SDK's ivstaudioprocessor.h, and those that plug-ins made up, with the
// browser's category.
constexpr SubCategory kSubCategories[] = {
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

std::map<QString, quint32> buildBitsByWord()
{
    std::map<QString, quint32> bitsByName;
    for (const Category &category : CategoryTable::categories())
        bitsByName[QString::fromLatin1(category.name)] =
            CategoryTable::instance().internalBit(category.index);
    std::map<QString, quint32> bitsByWord;
    for (const SubCategory &entry : kSubCategories)
        bitsByWord[QString::fromLatin1(entry.word)] = bitsByName.at(QString::fromLatin1(entry.category));
    return bitsByWord;
}

} // namespace

quint32 categoryFromSubCategories(const QString &subCategories)
{
    static const std::map<QString, quint32> bitsByWord = buildBitsByWord();
    quint32 category = 0;
    for (const QString &word : subCategories.split(QLatin1Char('|'))) {
        const auto found = bitsByWord.find(word.trimmed());
        if (found != bitsByWord.end())
            category |= found->second;
    }
    return category;
}

bool isInstrumentCategory(quint32 category)
{
    return (category & CategoryTable::instance().internalBit(CategoryTable::kInstrumentIndex)) != 0;
}
