#include "Main/AudioEngineController/Effects/Host/AudioPluginHost.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Catalogue/CategoryTable.h"
#include "Main/AudioEngineController/Effects/Plugin/AudioPlugin.h"
#include "Main/VLib/ApplicationContext.h"

QStringList AudioPluginHost::folders() const
{
    const IQuillonInterface *application = ApplicationContext::instance().quillonInterface;
    return application ? application->scanFolders() : QStringList();
}

quint32 AudioPluginHost::maskToCategory(quint32 mask) const
{
    return CategoryTable::instance().maskToCategory(mask);
}

quint32 AudioPluginHost::categoryToMask(quint32 category) const
{
    return CategoryTable::instance().categoryToMask(category);
}

LoadedPlugin AudioPluginHost::loadPlugin(const QString &identifier)
{
    const bool isKnown = findEffect(identifier).has_value();
    if (isKnown)
        DebugLog(L"%ls is known, but this host loads no plug-ins", identifier);
    return {isKnown, nullptr};
}
