#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"

#include "Core/BaseLib/Files/FileTime.h"
#include "Core/BaseLib/Files/XMLDocument.h"
#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"

#include <QFile>
#include <QFileInfo>

#include <algorithm>
#include <mutex>
#include <set>
#include <utility>

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
    // A name that starts with a dot would be hidden, and its marker never found; a device is not a file.
    const bool isUnusable = name.isEmpty() || name.startsWith(QLatin1Char('.')) || isDeviceName(name);
    return isUnusable ? QLatin1Char('_') + name : name;
}

QString cutToBytes(QString text, int limit)
{
    while (text.toUtf8().size() > limit)
        text = cutText(text, text.size() - 1);
    return text;
}

/// The markers of this process that are on disk.
struct ActiveMarkers {
    std::mutex mutex;
    std::set<QString> paths;
};

ActiveMarkers &activeMarkers()
{
    static ActiveMarkers &markers = *new ActiveMarkers; // outlives the watcher that may abandon them
    return markers;
}

bool contains(const std::set<QString> &paths, const QString &marker)
{
    return std::any_of(paths.begin(), paths.end(), [&](const QString &path) {
        return QString::compare(path, marker, Qt::CaseInsensitive) == 0; // as some file systems do
    });
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

constexpr char kSuspect[] = "Suspect";

QByteArray markerText(const MarkerFormat &format, const EffectRecord &record, bool isSuspect)
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
    if (isSuspect)
        text += elementLine(1, kSuspect, "1");
    return text + "</CrashedPlugin>" + kLineEnd;
}

bool namesSuspect(const QByteArray &content)
{
    return content.endsWith(elementLine(1, kSuspect, "1") + "</CrashedPlugin>" + kLineEnd);
}

QString markerPath(const MarkerFormat &format, const QString &folder, const QString &name)
{
    const QString ending = QString::fromLatin1(format.ending);
    return folder + QLatin1Char('/') + cutToBytes(usableFileName(name), kMaxFileName - ending.size()) +
           ending;
}

/// Whether something else bears a marker's name: a folder cannot be written to, and a pipe never ends.
bool isBlocked(const QString &marker)
{
    const QFileInfo info(marker);
    return info.exists() && !info.isFile();
}

/// A path that no marker in use has; called with the active markers locked.
QString freeMarkerPath(const MarkerFormat &format, const QString &folder, const EffectRecord &plugin,
                       const QStringList &taken)
{
    const auto isTaken = [&](const QString &marker) {
        return contains(activeMarkers().paths, marker) || taken.contains(marker, Qt::CaseInsensitive) ||
               isBlocked(marker);
    };
    QString marker = markerPath(format, folder, plugin.name);
    // A sub-plug-in may bear the name of its shell, whose own marker must stay as it is.
    if (isTaken(marker) && plugin.subId != 0)
        marker = markerPath(format, folder, plugin.name + QLatin1Char('_') + QString::number(plugin.subId));
    for (int number = 2; isTaken(marker); ++number) // in front, as the ends of long names are cut off
        marker = markerPath(format, folder, QString::number(number) + QLatin1Char('_') + plugin.name);
    return marker;
}

FileResult writeMarkerFile(const MarkerFormat &format, const QString &marker, const EffectRecord &record,
                           bool isSuspect)
{
    const QByteArray text = markerText(format, record, isSuspect);
    QFile file(marker);
    if (file.open(QIODevice::WriteOnly | QIODevice::Truncate) && file.write(text) == text.size() &&
        file.flush())
        return {};
    return {file.errorString()};
}

} // namespace

CrashMarker::CrashMarker(const MarkerFormat &format, const QString &folder, EffectRecord plugin,
                         const QString &name, const QStringList &taken, bool isSuspect)
{
    plugin.name = name;
    if (name.isNull())
        NameFromPath(plugin);
    {
        // Registered first: whoever abandons the markers must find this one whenever it is on disk.
        const std::lock_guard<std::mutex> lock(activeMarkers().mutex);
        m_path = freeMarkerPath(format, folder, plugin, taken);
        activeMarkers().paths.insert(m_path);
    }
    if (const FileResult written = writeMarkerFile(format, m_path, plugin, isSuspect); !written)
        DebugLog(L"Cannot write the crash marker %ls: %ls", m_path, written.reason);
}

CrashMarker::~CrashMarker() { remove(); }

CrashMarker::CrashMarker(CrashMarker &&other) noexcept
    : m_path(std::exchange(other.m_path, QString()))
{}

CrashMarker &CrashMarker::operator=(CrashMarker &&other) noexcept
{
    if (this != &other) {
        remove();
        m_path = std::exchange(other.m_path, QString());
    }
    return *this;
}

void CrashMarker::refresh() const
{
    if (!m_path.isEmpty())
        touchFile(m_path);
}

void CrashMarker::remove()
{
    if (m_path.isEmpty())
        return;
    const std::lock_guard<std::mutex> lock(activeMarkers().mutex);
    removeMarkerFile(m_path);
    activeMarkers().paths.erase(m_path);
    m_path.clear();
}

void CrashMarker::leave()
{
    const std::lock_guard<std::mutex> lock(activeMarkers().mutex);
    activeMarkers().paths.erase(m_path);
    m_path.clear();
}

void CrashMarker::abandonAll(const std::function<void()> &then)
{
    const std::lock_guard<std::mutex> lock(activeMarkers().mutex);
    if (activeMarkers().paths.empty())
        return;
    for (const QString &marker : activeMarkers().paths)
        removeFile(marker); // a failure is not logged: the plug-in that hangs may hold what the log waits for
    then();
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
    if (markerText(format, raw, namesSuspect(content)) == content)
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

const PluginFormatInfo *formatOfMarker(const QString &file)
{
    const PluginFormatInfo *found = nullptr;
    for (const PluginFormatInfo &info : pluginFormats())
        if (info.isScanned() && file.endsWith(QLatin1String(info.catalogue->marker.ending)))
            found = &info;
    return found;
}

QStringList markerPatterns()
{
    QStringList patterns;
    for (const PluginFormatInfo &info : pluginFormats())
        if (info.isScanned())
            patterns.append(QLatin1Char('*') + QLatin1String(info.catalogue->marker.ending));
    return patterns;
}

std::vector<FoundMarker> readMarkers(const QStringList &files)
{
    std::vector<FoundMarker> markers;
    for (const QString &file : files)
        if (const PluginFormatInfo *info = formatOfMarker(file)) {
            QByteArray content;
            readWholeFile(file, content);
            markers.push_back(
                {file, info->format, readMarkerFile(info->catalogue->marker, file), namesSuspect(content)});
        }
    return markers;
}

bool isExcused(const FoundMarker &marker, const std::vector<FoundMarker> &all)
{
    const auto isChild = [&](const FoundMarker &other) {
        return other.format == marker.format && other.plugin.subId != 0 &&
               isSamePath(other.plugin.path, marker.plugin.path);
    };
    return marker.isSuspect || (marker.plugin.subId == 0 && std::any_of(all.begin(), all.end(), isChild));
}
