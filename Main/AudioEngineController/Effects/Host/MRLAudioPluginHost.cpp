#include "Main/AudioEngineController/Effects/Host/MRLAudioPluginHost.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/VLib/ApplicationContext.h"

#include <QFile>

MRLAudioPluginHost::MRLAudioPluginHost()
    : CatalogueHost(PluginFormat::BuiltIn)
{}

void MRLAudioPluginHost::setBuiltInEffects(const std::vector<EffectRecord> &effects)
{
    clearEffects();
    for (const EffectRecord &effect : effects)
        AddEffect(effect);
    ReadCatalogue();
}

void MRLAudioPluginHost::ReadCatalogue()
{
    if (catalogueFolder().isEmpty())
        return;
    const TAutoLockCS lock(&m_ks);
    const CatalogueContents contents = readContents();
    const bool hasEffects = effectList().size() != 0;
    for (const EffectRecord &marks : contents.records) {
        if (hasEffects && !effectList().find(marks.id))
            DebugLog(
                L"The mark on the built-in effect %ls is passed over: there is no such effect. It goes when "
                L"the marks are written next.",
                marks.id);
        effectList().setFavourite(marks.id, marks.favourite);
    }
}

bool MRLAudioPluginHost::Scan(bool, bool) { return false; }

bool MRLAudioPluginHost::setFavourite(const QString &id, bool favourite)
{
    {
        const TAutoLockCS lock(&m_ks);
        if (!effectList().find(id))
            return false;
        effectList().setFavourite(id, favourite);
    }
    return writeMarks();
}

bool MRLAudioPluginHost::writeMarks()
{
    const IQuillonInterface *application = ApplicationContext::instance().quillonInterface;
    if (application && application->isScanner())
        return false;
    if (effects().empty()) {
        DebugLog(L"The marks on built-in effects are not written: there are no effects to mark");
        return false;
    }
    return WriteCatalogue();
}
