#include "Main/AudioEngineController/Effects/Catalogue/BuiltInCatalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/CLAPCatalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/VST3Catalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/VSTCatalogue.h"
#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"
#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"
#include "Tests/Fuzz/FuzzTarget.h"

#include <algorithm>

// The files that are written and read again the same: catalogues, crash markers, scan lists. Nothing in them
// is escaped, and lines are told by their ends.

namespace {

const QString kFile = "Catalogue.xml";

bool anyTextHolds(const std::vector<EffectRecord> &records, const char *characters)
{
    return std::any_of(records.begin(), records.end(), [&](const EffectRecord &record) {
        return anyHolds({record.path, record.fileTime, record.name, record.id, record.vendor,
                         record.categories, record.subName, record.version},
                        characters);
    });
}

void readAndWrite(const CatalogueFormat &format, const QByteArray &input)
{
    writeFuzzFile(kFile, input);
    const std::vector<EffectRecord> records = readCatalogueFile(format, kFile).records;
    const QByteArray written = renderCatalogue(format, records);
    writeFuzzFile(kFile, written);
    if (!anyTextHolds(records, "\n"))
        require(renderCatalogue(format, readCatalogueFile(format, kFile).records) == written,
                "what was read is written and read again the same, whatever the texts are");
}

void readAndWrite(const MarkerFormat &format, const QByteArray &input)
{
    const QString name = "Marker";
    writeFuzzFile(name, input);
    const EffectRecord read = readMarkerFile(format, name);
    require(!read.enabled && (format.hasSubId || read.subId == 0), "a marker names what is not enabled");
    if (anyHolds({read.path, read.fileTime, read.name}, "\r\n"))
        return; // markers are read by their lines where their texts make them no XML
    const QString shown = read.name.isNull() ? "" : read.name; // a null one would be made from the path
    const CrashMarker marker(format, ".", read, shown);
    const EffectRecord again = readMarkerFile(format, marker.path());
    require(again.path == read.path && again.fileTime == read.fileTime && again.name == read.name &&
                again.subId == read.subId,
            "what was read is written and read again the same");
}

} // namespace

void fuzzCatalogue(const QByteArray &input)
{
    readAndWrite(vst3CatalogueFormat(), input);
    readAndWrite(vstCatalogueFormat(), input);
    readAndWrite(clapCatalogueFormat(), input);
    readAndWrite(builtInEffectsFormat(), input);
}

void fuzzMarker(const QByteArray &input)
{
    readAndWrite(vst3CatalogueFormat().marker, input);
    readAndWrite(vstCatalogueFormat().marker, input);
    readAndWrite(clapCatalogueFormat().marker, input);
}

void fuzzScanList(const QByteArray &input)
{
    const QString path = QString::fromUtf8(input);
    require(path.startsWith(dataFolderOf(path)), "the data folder is the start of the list's path");

    const QString list = "FXScan.xml";
    writeFuzzFile(list, input);
    const ScanListContents contents = ReadScanList(list);
    require(contents || contents.folders.isEmpty(), "a list that cannot be used names no folders");
    if (anyHolds({contents.folders.join(QString())}, "\n"))
        return;
    require(bool(WriteScanList(list, contents.folders)), "a scan list can be written");
    require(ReadScanList(list).folders == contents.folders,
            "what was read is written and read again the same");
}
