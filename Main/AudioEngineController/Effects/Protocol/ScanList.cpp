#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"

#include "Core/BaseLib/Files/XMLDocument.h"
#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"

QString dataFolderOf(const QString &scanListPath)
{
    for (const QLatin1String folder : {QLatin1String("/Effects/"), QLatin1String("\\Effects\\")}) {
        const int at = scanListPath.lastIndexOf(folder);
        if (at >= 0)
            return scanListPath.left(at);
    }
    return QString();
}

QStringList ReadScanList(const QString &path)
{
    QStringList folders;
    XMLDocument document;
    if (!document.load(path)) {
        DebugLog(L"Cannot read the scan list %ls: %ls", path, document.error());
        return folders;
    }
    for (const XMLElement &folder : document.root("Scan").children("Path"))
        folders.append(folder.text());
    return folders;
}

FileResult WriteScanList(const QString &path, const QStringList &folders)
{
    QByteArray text = xmlHeaderLine() + "<Scan>" + kLineEnd;
    for (const QString &folder : folders)
        text += elementLine(1, "Path", folder.toUtf8());
    text += QByteArray("</Scan>") + kLineEnd;
    return replaceFile(path, text, Durability::Buffered);
}
