#include "Main/AudioEngineController/Effects/Catalogue/BuiltInCatalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/VST3Catalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/VSTCatalogue.h"
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
    const std::vector<EffectRecord> records = readCatalogueFile(format, kFile).records;
    const QByteArray written = renderCatalogue(format, records);
    writeFuzzFile(kFile, written);
    if (!anyTextHolds(records, "\n")) // nothing is escaped, and lines are told by their ends
        require(renderCatalogue(format, readCatalogueFile(format, kFile).records) == written,
                "what was read is written and read again the same, whatever the texts are");
}

} // namespace

void fuzzCatalogue(const QByteArray &input)
{
    readAndWrite(vst3CatalogueFormat(), input);
    readAndWrite(vstCatalogueFormat(), input);
    readAndWrite(builtInEffectsFormat(), input);
}
