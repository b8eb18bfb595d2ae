#include "Main/AudioEngineController/Effects/VST3/VST3Host.h"

#include "Main/AudioEngineController/Effects/VST3/VST3Catalogue.h"
#include "Main/AudioEngineController/Effects/VST3/VST3FolderScan.h"

VST3Host::VST3Host()
    : AudioPluginHost(&vst3CatalogueFormat())
{}

bool VST3Host::Scan(bool scan, bool inProcess)
{
    return scan ? VST3FolderScan(*this).run() : AudioPluginHost::Scan(scan, inProcess);
}

bool VST3Host::isMarkerWithoutRecord(const EffectRecord &marker) const
{
    // NOTE: a WaveShell holds the plug-ins of a whole vendor; one crash must not switch all of them off.
    return marker.name.contains(QLatin1String("WaveShell"));
}
