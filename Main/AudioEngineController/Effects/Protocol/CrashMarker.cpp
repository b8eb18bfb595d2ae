#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"

#include "Core/BaseLib/Files/XMLDocument.h"
#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"

#include <QFile>

#include <algorithm>
#include <mutex>
#include <set>

namespace {

/// Longest file name in bytes that the usual file systems take (NAME_MAX in limits.h; 255 UTF-16 units on
/// NTFS).
constexpr int kMaxFileName = 255;

QString usableFileName(QString name)
{
    name.replace(QLatin1String(".."), QLatin1String("__"));
    for (QChar &character : name)
        if (character < QLatin1Char(' ') || QLatin1String("<>:\"/\\|?*").contains(character))
            character = QLatin1Char('_');
    // A name that starts with a dot would be hidden, and its marker never found; a device is no file.
    const bool isUnusable = name.isEmpty() || name.startsWith(QLatin1Char('.')) || isDeviceName(name);
    return isUnusable ? QLatin1Char('_') + name : name;
}

QString cutToBytes(QString text, int limit)
{
    while (text.toUtf8().size() > limit)
        text = cutText(text, text.size() - 1);
    return text;
}

struct Markers {
    std::mutex mutex;
    std::set<QString> paths;
};

Markers &activeMarkers()
{
    static Markers &markers = *new Markers; // outlives the watcher that may abandon them
    return markers;
}

/// The raw content of one of our own lines; empty where there is none.
QString rawElement(const QString &text, const char *name)
{
    const QString start = QStringLiteral("\n\t<%1>").arg(QLatin1String(name));
    const int from = text.indexOf(start);
    // At the end of its line: the content may look like an end itself.
    const int to =
        text.indexOf(QStringLiteral("</%1>").arg(QLatin1String(name)) + QString::fromLatin1(kLineEnd), from);
    return from < 0 || to < 0 ? QString() : text.mid(from + start.size(), to - from - start.size());
}

/// Reads a marker by its lines.
EffectRecord rawRecord(const MarkerFormat &format, const QByteArray &content)
{
    const QString text = QString::fromUtf8(content);
    EffectRecord record;
    record.enabled = false;
    record.path = rawElement(text, "Path");
    record.fileTime = rawElement(text, "Created");
    record.name = rawElement(text, "Name");
    if (format.hasSubId)
        record.subId = static_cast<quint32>(parseInteger(rawElement(text, "SubID")));
    if (record.subId != 0)
        record.subName = record.name;
    return record;
}

QByteArray markerText(const MarkerFormat &format, const EffectRecord &record)
{
    QByteArray text = xmlHeaderLine() + "<CrashedPlugin>" + kLineEnd;
    if (!format.leavesOutEmpty || !record.path.isEmpty())
        text += elementLine(1, "Path", record.path.toUtf8());
    if (!format.leavesOutEmpty || !record.fileTime.isEmpty())
        text += elementLine(1, "Created", record.fileTime.toUtf8());
    text += elementLine(1, "Name", record.name.toUtf8());
    // Signed, unlike the catalogue's: markers of earlier versions carry it so.
    if (format.hasSubId && record.subId != 0)
        text += elementLine(1, "SubID", QByteArray::number(static_cast<qint32>(record.subId)));
    return text + "</CrashedPlugin>" + kLineEnd;
}

} // namespace

QString markerPath(const MarkerFormat &format, const QString &folder, const QString &path,
                   const QString &name)
{
    EffectRecord record;
    record.path = path;
    record.name = name;
    if (name.isNull())
        NameFromPath(record);
    const QString ending = QString::fromLatin1(format.ending);
    return folder + QLatin1Char('/') + cutToBytes(usableFileName(record.name), kMaxFileName - ending.size()) +
           ending;
}

FileResult writeMarkerFile(const MarkerFormat &format, const QString &marker, const EffectRecord &record)
{
    const QByteArray text = markerText(format, record);
    QFile file(marker);
    if (file.open(QIODevice::WriteOnly | QIODevice::Truncate) && file.write(text) == text.size() &&
        file.flush())
        return {};
    return {file.errorString()};
}

EffectRecord readMarkerFile(const MarkerFormat &format, const QString &marker)
{
    EffectRecord record;
    record.enabled = false;
    QByteArray content;
    if (const FileResult read = readWholeFile(marker, content); !read) {
        DebugLog(L"Cannot read the crash marker %ls: %ls", marker, read.reason);
        return record;
    }
    // Markers are not escaped: a path with "<" makes one no XML, or XML that says something else. What we
    // wrote is read by its lines; its plug-in would crash every run otherwise.
    const EffectRecord raw = rawRecord(format, content);
    if (markerText(format, raw) == content)
        return raw;
    XMLDocument document(XMLDocument::Entities::Literal);
    if (!document.parse(content)) {
        DebugLog(L"Cannot read the crash marker %ls: %ls", marker, document.error());
        return content.trimmed().endsWith("</CrashedPlugin>") ? raw : record;
    }
    const XMLElement crashed = document.root("CrashedPlugin");
    record.path = crashed.child("Path").text();
    record.fileTime = crashed.child("Created").text();
    record.name = crashed.child("Name").text();
    // The last one: a name, which is not escaped, may hold something that looks like another.
    const std::vector<XMLElement> ids = crashed.children("SubID");
    if (format.hasSubId && !ids.empty())
        record.subId = static_cast<quint32>(ids.back().integer());
    if (record.subId != 0)
        record.subName = record.name;
    return record;
}

void removeMarkerFile(const QString &marker)
{
    if (const FileResult removed = removeFile(marker); !removed)
        DebugLog(L"Cannot delete the crash marker %ls: %ls", marker, removed.reason);
}

void ActiveMarkers::add(const QString &marker)
{
    Markers &markers = activeMarkers();
    const std::lock_guard<std::mutex> lock(markers.mutex);
    markers.paths.insert(marker);
}

bool ActiveMarkers::contains(const QString &marker)
{
    Markers &markers = activeMarkers();
    const std::lock_guard<std::mutex> lock(markers.mutex);
    return std::any_of(markers.paths.begin(), markers.paths.end(), [&](const QString &path) {
        return QString::compare(path, marker, Qt::CaseInsensitive) == 0;
    });
}

void ActiveMarkers::remove(const QString &marker)
{
    Markers &markers = activeMarkers();
    const std::lock_guard<std::mutex> lock(markers.mutex);
    removeMarkerFile(marker);
    markers.paths.erase(marker);
}

void ActiveMarkers::abandon(const std::function<void()> &then)
{
    Markers &markers = activeMarkers();
    const std::lock_guard<std::mutex> lock(markers.mutex);
    if (markers.paths.empty())
        return;
    for (const QString &marker : markers.paths)
        removeFile(marker); // a failure is not logged: the plug-in that hangs may hold what the log waits for
    then();
}
