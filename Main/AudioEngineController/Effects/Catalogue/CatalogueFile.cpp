#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"

#include <QList>

namespace {

EffectRecord readRecord(const CatalogueFormat &format, const XMLElement &effect)
{
    EffectRecord record;
    for (const CatalogueElement &element : format.elements) {
        if (!element.read)
            continue;
        if (const XMLElement child = effect.child(element.name))
            element.read(record, child);
    }
    return record;
}

void upgradeRecord(const CatalogueFormat &format, double version, EffectRecord &record)
{
    if (version < format.fileTimesTrustedFrom)
        record.fileTime = format.fileTime(record.path);
    if (version < format.categoryMasksFrom)
        record.category = 0;
}

/// A line of ours with its content escaped; lines of any other form as they are.
QByteArray escapedLine(const QByteArray &line)
{
    const int start = line.indexOf('>') + 1;
    const int end = line.lastIndexOf("</");
    if (start <= 0 || end < start)
        return line;
    QByteArray content = line.mid(start, end - start);
    content.replace('&', "&amp;").replace('<', "&lt;").replace('>', "&gt;");
    return line.left(start) + content + line.mid(end);
}

} // namespace

CatalogueContents readCatalogueFile(const CatalogueFormat &format, const QString &path)
{
    CatalogueContents contents;
    QByteArray text;
    if (const FileResult read = readWholeFile(path, text); !read) {
        contents.isUnread = true;
        contents.reason = read.reason;
        return contents;
    }
    XMLDocument document(XMLDocument::Entities::Literal);
    if (!document.parse(text)) {
        contents.isBroken = true;
        contents.reason = document.error();
        return contents;
    }
    const XMLElement root = document.root("Effects");
    if (!root) {
        contents.reason = QStringLiteral("it has no \"Effects\" element");
        return contents;
    }
    const std::optional<QString> stated = root.attribute("version");
    if (!stated && format.versionRequired) {
        contents.reason = QStringLiteral("it states no version");
        return contents;
    }
    const double version = stated ? parseDecimal(*stated) : 1.0;
    contents.upgraded = version < format.fileTimesTrustedFrom || version < format.categoryMasksFrom;
    for (const XMLElement &effect : root.children("Effect")) {
        contents.records.push_back(readRecord(format, effect));
        upgradeRecord(format, version, contents.records.back());
    }
    return contents;
}

std::vector<EffectRecord> salvageRecords(const CatalogueFormat &format, const QString &path)
{
    std::vector<EffectRecord> records;
    QByteArray content;
    QByteArray block;
    if (!readWholeFile(path, content))
        return records;
    const QList<QByteArray> lines = content.replace("\r\n", "\n").split('\n');
    for (const QByteArray &line : lines) {
        if (line == "\t<Effect>")
            block.clear();
        block += escapedLine(line) + '\n';
        XMLDocument document;
        if (line == "\t</Effect>" && document.parse(block))
            records.push_back(readRecord(format, document.root("Effect")));
    }
    return records;
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
