#include "Scanner/QuillonInterfaceImpl.h"

QuillonInterfaceImpl::QuillonInterfaceImpl(const QString &dataFolder, const QStringList &scanFolders)
    : m_dataFolder(dataFolder)
    , m_scanFolders(scanFolders)
{}
