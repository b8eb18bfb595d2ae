#include "Main/AudioEngineController/Effects/CLAP/CLAPHost.h"
#include "Main/AudioEngineController/Effects/Catalogue/CLAPCatalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/VST3Catalogue.h"
#include "Main/AudioEngineController/Effects/Catalogue/VSTCatalogue.h"
#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Host.h"
#include "Tests/Fuzz/FuzzTarget.h"

#include <QDir>
#include <QFile>

#include <algorithm>

// What an earlier run left: a catalogue of any version, of files that are there, gone or moved; and behind a
// line "--- marker" a crash marker. A host reads both, as at the start of a scan, and another one reads what
// the first one left.

namespace {

const QString kCatalogues = "Effects";
const QByteArray kSeparator = "\n--- marker\n";

/// What a host absorbed from a marker is in the catalogue, where the next one finds it.
void checkKept(const CatalogueHost &first, CatalogueHost &second, const EffectRecord &crashed)
{
    for (const EffectRecord *record : first.known().all())
        if (anyHolds({record->path, record->name, record->id, record->vendor, record->categories,
                      record->subName, record->fileTime, record->version},
                     "\n"))
            return; // nothing is escaped
    second.setCatalogueFolder(first.catalogueFolder());
    second.ReadCatalogue();
    const KnownList::Records kept = second.known().recordsOfPath(crashed.path);
    require(crashed.path.isEmpty() ||
                std::any_of(kept.begin(), kept.end(),
                            [](const EffectRecord *record) { return !record->enabled && !record->working; }),
            "what crashed stays disabled");
}

template <typename Host>
void readLeftovers(const CatalogueFormat &format, const QByteArray &catalogue, const QByteArray &marker)
{
    const QString cataloguePath = kCatalogues + QLatin1String(format.fileName);
    const QString markerPath = kCatalogues + "/Marker" + QLatin1String(format.marker.ending);
    writeFuzzFile(cataloguePath, catalogue);
    if (!marker.isNull())
        writeFuzzFile(markerPath, marker);
    const EffectRecord crashed = readMarkerFile(format.marker, markerPath);

    Host host;
    host.setCatalogueFolder(kCatalogues);
    host.ReadCatalogue();
    Host next;
    if (!QFile::exists(markerPath))
        checkKept(host, next, crashed);
    QFile::remove(markerPath);
}

} // namespace

void fuzzKnown(const QByteArray &input)
{
    require(QDir().mkpath(kCatalogues), "there is a folder for catalogues");
    const int at = input.indexOf(kSeparator);
    const QByteArray catalogue = input.left(at);
    const QByteArray marker = at < 0 ? QByteArray() : input.mid(at + kSeparator.size());
    readLeftovers<VST3Host>(vst3CatalogueFormat(), catalogue, marker);
    readLeftovers<VSTHost>(vstCatalogueFormat(), catalogue, marker);
    readLeftovers<CLAPHost>(clapCatalogueFormat(), catalogue, marker);
}
