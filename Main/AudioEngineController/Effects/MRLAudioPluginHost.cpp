#include "Main/AudioEngineController/Effects/MRLAudioPluginHost.h"

#include "Core/BaseLib/DebugLog.h"

#include <QFile>

const CatalogueFormat &builtInEffectsFormat()
{
    using namespace CatalogueElements;
    static const CatalogueElement writtenMask = {kCategoryMask.name, nullptr, kCategoryMask.content};
    static const CatalogueFormat format = {"/TesselFXConfiguration.xml",  "1.2", false, 0.0, 0.0, nullptr, {},
                                           {kId, kFavourite, writtenMask}};
    return format;
}

MRLAudioPluginHost::MRLAudioPluginHost()
    : AudioPluginHost(&builtInEffectsFormat())
{}

void MRLAudioPluginHost::setBuiltInEffects(const std::vector<EffectRecord> &effects)
{
    clearEffects();
    for (const EffectRecord &effect : effects)
        AddEffect(effect);
}

void MRLAudioPluginHost::ReadCatalogue()
{
    const QString path = cataloguePath();
    if (!QFile::exists(path))
        return;
    const CatalogueContents contents = readCatalogueFile(*format(), path);
    if (!contents)
        DebugLog(L"Cannot use the catalogue %ls: %ls", path, contents.reason);
    const TAutoLockCS lock(&m_ks);
    for (const EffectRecord &marks : contents.records)
        effectList().setFavourite(marks.id, marks.favourite);
}

bool MRLAudioPluginHost::Scan(bool, bool) { return false; }
