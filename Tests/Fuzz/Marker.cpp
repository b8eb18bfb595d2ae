#include "Main/AudioEngineController/Effects/Catalogue/VST3Catalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/VSTCatalogue.h"
#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"
#include "Tests/Fuzz/FuzzTarget.h"

namespace {

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

void fuzzMarker(const QByteArray &input)
{
    readAndWrite(vst3CatalogueFormat().marker, input);
    readAndWrite(vstCatalogueFormat().marker, input);
}
