#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"
#include "Main/AudioEngineController/Effects/Host/MRLAudioPluginHost.h"
#include "Main/AudioEngineController/Effects/VST/VSTCatalogue.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Catalogue.h"
#include "Tests/Fuzz/FuzzTarget.h"

#include <algorithm>

namespace {

const QString kFile = "Catalogue.xml";

bool anyTextHolds(const std::vector<EffectRecord> &records, const char *characters)
{
    return std::any_of(records.begin(), records.end(), [&](const EffectRecord &record) {
        return anyHolds({record.path, record.fileTime, record.name, record.id, record.vendor,
                         record.categories, record.subName},
                        characters);
    });
}

void readAndWrite(const CatalogueFormat &format, const QByteArray &input)
{
    writeFuzzFile(kFile, input);
    const CatalogueContents contents = readCatalogueFile(format, kFile);
    require(contents || contents.records.empty(), "a file that cannot be used gives no records");
    const std::vector<EffectRecord> records = contents ? contents.records : salvageRecords(format, kFile);
    const QByteArray written = renderCatalogue(format, records);
    writeFuzzFile(kFile, written);
    // Nothing is escaped.
    if (!anyTextHolds(records, "<"))
        require(renderCatalogue(format, readCatalogueFile(format, kFile).records) == written,
                "what was read is written and read again the same");
    if (!anyTextHolds(records, "\n"))
        require(renderCatalogue(format, salvageRecords(format, kFile)) == written,
                "what was written is salvaged whole, whatever the texts are");
}

} // namespace

void fuzzCatalogue(const QByteArray &input)
{
    readAndWrite(vst3CatalogueFormat(), input);
    readAndWrite(vstCatalogueFormat(), input);
    readAndWrite(builtInEffectsFormat(), input);
}
