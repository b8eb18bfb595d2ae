#include "Workstation/ReasonStore.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

namespace {
const QString kFormat = QStringLiteral("format");
const QString kPath = QStringLiteral("path");
const QString kSubId = QStringLiteral("subId");
const QString kFileTime = QStringLiteral("fileTime");
const QString kReason = QStringLiteral("reason");
} // namespace

ReasonStore::ReasonStore(const QString &file)
{
    QByteArray content;
    if (!readWholeFile(file, content))
        return;
    for (const QJsonValue value : QJsonDocument::fromJson(content).array()) {
        const QJsonObject entry = value.toObject();
        if (const PluginFormatInfo *format = formatOfKey(entry[kFormat].toString()))
            set({format->format, entry[kPath].toString(), static_cast<quint32>(entry[kSubId].toDouble())},
                entry[kFileTime].toString(), entry[kReason].toString());
    }
}

QString ReasonStore::find(const PluginKey &key, const QString &fileTime) const
{
    const auto found = m_entries.find(key);
    return found != m_entries.end() && found->second.fileTime == fileTime ? found->second.reason : QString();
}

void ReasonStore::set(const PluginKey &key, const QString &fileTime, const QString &reason)
{
    m_entries[key] = {fileTime, reason};
}

FileResult ReasonStore::write(const QString &file) const
{
    QJsonArray entries;
    for (const auto &[key, entry] : m_entries)
        entries.append(QJsonObject{{kFormat, QLatin1String(formatInfo(key.format).key)},
                                   {kPath, key.path},
                                   {kSubId, static_cast<qint64>(key.subId)},
                                   {kFileTime, entry.fileTime},
                                   {kReason, entry.reason}});
    return replaceFile(file, QJsonDocument(entries).toJson(), Durability::Buffered);
}
