#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"

#include "Main/AudioEngineController/Effects/Catalogue/CatalogueLines.h"

#include <QDir>

namespace {

EffectRecord readRecord(const CatalogueFormat &format, const XMLElement &effect)
{
    EffectRecord record;
    for (const CatalogueElement &element : format.elements) {
        if (!element.read)
            continue;
        if (const XMLElement child = effect.child(element.name))
            element.read(record, ElementContent(child));
    }
    return record;
}

/// What a file of another layout holds; the version, where it states one.
std::optional<QString> readAsXml(const CatalogueFormat &format, const XMLDocument &document,
                                 CatalogueContents &contents)
{
    const XMLElement root = document.root("Effects");
    if (!root) {
        contents.reason = QStringLiteral("it has no \"Effects\" element");
        return std::nullopt;
    }
    const std::optional<QString> version = root.attribute("version");
    if (!version && format.versionRequired) {
        contents.reason = QStringLiteral("it states no version");
        return std::nullopt;
    }
    for (const XMLElement &effect : root.children("Effect"))
        contents.records.push_back(readRecord(format, effect));
    return version.value_or(QStringLiteral("1.0"));
}

void upgrade(const CatalogueFormat &format, double version, const FileTimeOf &fileTimeOf,
             CatalogueContents &contents)
{
    const bool hasOldTimes = version < format.fileTimesTrustedFrom;
    const bool hasOldMasks = version < format.categoryMasksFrom;
    for (EffectRecord &record : contents.records) {
        if (hasOldTimes)
            record.fileTime = fileTimeOf ? fileTimeOf(record.path) : QString();
        if (hasOldMasks)
            record.category = 0;
    }
}

/// What is damaged may have told of more plug-ins of these files, and more of these. Nobody asks what
/// crashed.
void haveAskedAgain(std::vector<EffectRecord> &records)
{
    for (EffectRecord &record : records)
        if (record.enabled && record.working)
            record.fileTime.clear();
        else if (record.name.isEmpty())
            NameFromPath(record);
}

} // namespace

CatalogueContents readCatalogueFile(const CatalogueFormat &format, const QString &path,
                                    const FileTimeOf &fileTimeOf)
{
    CatalogueContents contents;
    QByteArray text;
    if (const FileResult read = readWholeFile(path, text); !read) {
        contents.isUnread = true;
        contents.reason = read.reason;
        return contents;
    }
    CatalogueLines lines = readCatalogueLines(format, text);
    contents.isAsWritten =
        lines.isWhole && lines.isAsWritten && lines.version == QLatin1String(format.version);
    if (!lines.isWhole)
        lines = readEditedLines(format, text);
    std::optional<QString> version = lines.version;
    XMLDocument document(XMLDocument::Entities::Literal);
    if (lines.isWhole && version) {
        contents.records = std::move(lines.records);
    } else if (document.parse(text)) {
        version = readAsXml(format, document, contents);
    } else {
        contents.reason = document.error();
        contents.records = std::move(lines.records);
        haveAskedAgain(contents.records);
    }
    for (EffectRecord &record : contents.records) {
        const QString clean = QDir::fromNativeSeparators(record.path); // as other writers may have it
        contents.isAsWritten &= clean == record.path;
        record.path = clean;
    }
    upgrade(format, parseDecimal(version.value_or(QString::fromLatin1(format.version))), fileTimeOf,
            contents);
    return contents;
}

QByteArray xmlHeaderLine() { return QByteArray("<?xml version=\"1.0\" encoding=\"UTF-8\"?>") + kLineEnd; }

QByteArray elementLine(int indent, const char *name, const QByteArray &content)
{
    return QByteArray(indent, '\t') + '<' + name + '>' + content + "</" + name + '>' + kLineEnd;
}

QByteArray renderRecord(const CatalogueFormat &format, const EffectRecord &record)
{
    QByteArray text = QByteArray("\t<Effect>") + kLineEnd;
    for (const CatalogueElement &element : format.elements) {
        if (!element.content)
            continue;
        if (const std::optional<QByteArray> content = element.content(record))
            text += elementLine(2, element.name, *content);
    }
    return text + "\t</Effect>" + kLineEnd;
}

QByteArray renderCatalogue(const CatalogueFormat &format, const std::vector<const QByteArray *> &records)
{
    const QByteArray root = QByteArray("<Effects version=\"") + format.version + "\">" + kLineEnd;
    const QByteArray end = QByteArray("</Effects>") + kLineEnd;
    int size = xmlHeaderLine().size() + root.size() + end.size();
    for (const QByteArray *record : records)
        size += record->size();
    QByteArray text;
    text.reserve(size);
    text += xmlHeaderLine();
    text += root;
    for (const QByteArray *record : records)
        text += *record;
    return text + end;
}

QByteArray renderCatalogue(const CatalogueFormat &format, const std::vector<EffectRecord> &records)
{
    std::vector<QByteArray> texts;
    std::vector<const QByteArray *> pointers;
    texts.reserve(records.size());
    for (const EffectRecord &record : records) {
        texts.push_back(renderRecord(format, record));
        pointers.push_back(&texts.back());
    }
    return renderCatalogue(format, pointers);
}
