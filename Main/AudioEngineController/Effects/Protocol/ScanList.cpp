#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"

#include "Core/BaseLib/Files/XMLDocument.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueLines.h"

#include <QFile>

QString dataFolderOf(const QString &scanListPath)
{
    for (const QLatin1String folder : {QLatin1String("/Effects/"), QLatin1String("\\Effects\\")}) {
        const int at = scanListPath.lastIndexOf(folder);
        if (at >= 0)
            return scanListPath.left(at);
    }
    return QString();
}

ScanListContents ReadScanList(const QString &path)
{
    ScanListContents contents;
    QByteArray text;
    if (!QFile::exists(path))
        return contents;
    if (const FileResult read = readWholeFile(path, text); !read) {
        contents.reason = read.reason;
        return contents;
    }
    if (readScanListLines(text, contents.folders))
        return contents;
    XMLDocument document;
    if (!document.parse(text))
        contents.reason = document.error();
    else if (!text.trimmed().endsWith("</Scan>"))
        contents.reason = QStringLiteral("it does not end with \"</Scan>\"");
    else
        for (const XMLElement &folder : document.root("Scan").children("Path"))
            contents.folders.append(folder.text());
    return contents;
}

FileResult WriteScanList(const QString &path, const QStringList &folders)
{
    QByteArray text = xmlHeaderLine() + "<Scan>" + kLineEnd;
    for (const QString &folder : folders)
        text += elementLine(1, "Path", folder.toUtf8());
    text += QByteArray("</Scan>") + kLineEnd;
    return replaceFile(path, text, Durability::Buffered);
}
