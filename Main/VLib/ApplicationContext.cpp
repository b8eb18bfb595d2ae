#include "Main/VLib/ApplicationContext.h"

ApplicationContext &ApplicationContext::instance()
{
    static ApplicationContext context;
    return context;
}

HostApplication::HostApplication(const QString &dataFolder, const QStringList &scanFolders)
    : m_dataFolder(dataFolder)
    , m_scanFolders(scanFolders)
{
    ApplicationContext::instance().quillonInterface = this;
}

HostApplication::~HostApplication()
{
    if (ApplicationContext::instance().quillonInterface == this)
        ApplicationContext::instance().quillonInterface = nullptr;
}
