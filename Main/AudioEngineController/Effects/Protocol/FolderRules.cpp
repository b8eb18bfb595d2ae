#include "Main/AudioEngineController/Effects/Protocol/FolderRules.h"

#include "Core/BaseLib/Files/AnswerInTime.h"
#include "Core/BaseLib/Files/NativeFile.h"
#include "Core/BaseLib/Files/SearchArea.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <QDir>
#include <QFile>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

namespace {

constexpr int kThisVersion = 1;
const QLatin1String kVersion("version");
const QLatin1String kExcluded("excluded");
const QLatin1String kIgnored("ignored");

/// The list of that name. One that is not there is empty; one that holds something else than full paths says
/// so.
QStringList pathsOf(const QJsonObject &root, QLatin1String name, QString &reason)
{
    QStringList paths;
    if (root.contains(name) && !root.value(name).isArray())
        reason = QStringLiteral("\"%1\" is not a list").arg(name);
    for (const QJsonValue value : root.value(name).toArray()) {
        const QString path = value.toString();
        if (!QDir::isAbsolutePath(path))
            reason = QStringLiteral("\"%1\" holds something that is not a full path").arg(name);
        paths.append(QDir::cleanPath(path));
    }
    return paths;
}

} // namespace

bool FolderRules::isIgnored(const QString &path) const
{
    return !ignored.isEmpty() && (isBelowAny(path, ignored) ||
                                  (fileAnswers(path) && isBelowAny(realPath(path).value_or(path), ignored)));
}

FolderRules readFolderRules(const QString &effectsFolder)
{
    FolderRules rules;
    const QString path = effectsFolder + QLatin1String(kFolderRulesFile);
    QByteArray text;
    if (!QFile::exists(path))
        return rules;
    if (const FileResult read = readWholeFile(path, text); !read) {
        rules.reason = read.reason;
        return rules;
    }
    QJsonParseError error{};
    const QJsonDocument document = QJsonDocument::fromJson(text, &error);
    const QJsonObject root = document.object();
    if (!document.isObject())
        rules.reason = document.isNull() ? error.errorString() : QStringLiteral("it is not a JSON object");
    else if (root.value(kVersion).toInt() != kThisVersion)
        rules.reason = QStringLiteral("it is not of version %1").arg(kThisVersion);
    if (!rules)
        return rules;
    rules.excluded = pathsOf(root, kExcluded, rules.reason);
    rules.ignored = pathsOf(root, kIgnored, rules.reason);
    return rules ? rules : FolderRules{{}, {}, rules.reason};
}

FileResult writeFolderRules(const QString &effectsFolder, const FolderRules &rules)
{
    const QJsonObject root{{kVersion, kThisVersion},
                           {kExcluded, QJsonArray::fromStringList(rules.excluded)},
                           {kIgnored, QJsonArray::fromStringList(rules.ignored)}};
    return replaceFile(effectsFolder + QLatin1String(kFolderRulesFile), QJsonDocument(root).toJson(),
                       Durability::Synced);
}

QStringList searchedOnly()
{
    QStringList paths;
    const QString text = qEnvironmentVariable("FXPROBE_ONLY");
    const QChar separator = text.contains(QLatin1Char('\n')) ? QLatin1Char('\n') : QDir::listSeparator();
    for (const QString &path : text.split(separator, Qt::SkipEmptyParts)) {
        const QString bundle = bundleOf(path + QLatin1Char('/')); // a bundle is searched as a whole
        paths.append(bundle.isEmpty() ? path : bundle);
    }
    return paths;
}

QString searchedOnlyText(const QStringList &paths)
{
    QString text;
    for (const QString &path : paths)
        text += path + QLatin1Char('\n');
    return text;
}
