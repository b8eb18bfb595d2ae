#include "Workstation/Retry.h"

#include "Core/BaseLib/Files/FileFinder.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"
#include "Workstation/Summary/CatalogueView.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <algorithm>
#include <set>

namespace {

bool isNamed(const EffectRecord &record, const QString &name)
{
    const auto equals = [&name](const QString &text) { return text.compare(name, Qt::CaseInsensitive) == 0; };
    return equals(record.name) || equals(fileNameOf(record.path)) || equals(record.path) ||
           record.path == QDir::cleanPath(QFileInfo(name).absoluteFilePath());
}

/// Gives the chosen records another chance; the number of them.
class Chooser {
public:
    explicit Chooser(const QStringList &names)
        : m_names(names)
        , m_unknown(names)
    {}

    bool choose(const EffectRecord &record)
    {
        if (record.working)
            return false;
        bool isChosen = m_names.isEmpty();
        for (const QString &name : m_names) {
            if (!isNamed(record, name))
                continue;
            isChosen = true;
            m_unknown.removeAll(name);
        }
        return isChosen;
    }
    const QStringList &unknown() const { return m_unknown; }

private:
    QStringList m_names;
    QStringList m_unknown;
};

int reopen(std::vector<EffectRecord> &records, Chooser &chooser)
{
    std::set<QString> files;
    // To the front: one that the user switched off would speak for the file, which would not be probed.
    const auto others = std::stable_partition(
        records.begin(), records.end(), [&](const EffectRecord &record) { return chooser.choose(record); });
    for (auto record = records.begin(); record != others; ++record)
        files.insert(record->path);
    // Any of a file's records may be the one that speaks for it, and keep it from being touched. But a
    // sub-plug-in that killed the scanner is loaded again only when it, or its whole file, was meant.
    std::set<QString> wholeFiles;
    for (auto record = records.begin(); record != others; ++record)
        if (record->subId == 0)
            wholeFiles.insert(record->path);
    for (auto record = records.begin(); record != records.end(); ++record) {
        const bool isOtherChild = record >= others && record->subId != 0 && !record->enabled &&
                                  !record->working && wholeFiles.count(record->path) == 0;
        if (files.count(record->path) == 0 || isOtherChild)
            continue;
        record->fileTime.clear();
        record->enabled |= !record->working;
    }
    return static_cast<int>(std::distance(records.begin(), others));
}

/// A catalogue with what is to be written of it.
struct Reopened {
    const PluginFormatInfo *format;
    QString path;
    std::vector<EffectRecord> records;
    int count;
};

/// Names of files that lie in the folders and have no record.
QStringList withoutUnrecorded(QStringList names, const QStringList &folders,
                              const std::vector<Reopened> &catalogues)
{
    std::set<QString> recorded;
    for (const Reopened &catalogue : catalogues)
        for (const EffectRecord &record : catalogue.records)
            recorded.insert(record.path);
    const auto dropNamesOf = [&](const QString &path) {
        EffectRecord file;
        file.path = path;
        NameFromPath(file);
        const auto isThisFile = [&](const QString &name) { return isNamed(file, name); };
        if (recorded.count(path) == 0)
            names.erase(std::remove_if(names.begin(), names.end(), isThisFile), names.end());
    };
    for (const PluginFormatInfo &format : pluginFormats())
        for (const QString &folder : names.isEmpty() || !format.isScanned() ? QStringList() : folders)
            for (const QString &path : findFiles(folder, format.moduleEnding))
                dropNamesOf(path);
    return names;
}

} // namespace

RetryOutcome retryPlugins(const QString &effectsFolder, const QStringList &names, const QStringList &folders)
{
    RetryOutcome outcome;
    Chooser chooser(names);
    std::vector<Reopened> catalogues;
    for (const PluginFormatInfo &format : pluginFormats()) {
        if (!format.isScanned())
            continue;
        const QString path = effectsFolder + QLatin1String(format.catalogue->fileName);
        if (!QFile::exists(path))
            continue;
        CatalogueContents contents = readCatalogueFile(*format.catalogue, path);
        const int count = reopen(contents.records, chooser);
        catalogues.push_back({&format, path, std::move(contents.records), count});
    }
    outcome.unknown = withoutUnrecorded(chooser.unknown(), folders, catalogues);
    if (!outcome.unknown.isEmpty())
        return outcome;
    for (const Reopened &catalogue : catalogues) {
        outcome.plugins += catalogue.count;
        if (catalogue.count == 0)
            continue;
        if (const FileResult written =
                replaceFile(catalogue.path, renderCatalogue(*catalogue.format->catalogue, catalogue.records),
                            Durability::Synced);
            !written)
            outcome.written.reason = QStringLiteral("%1: %2").arg(catalogue.path, written.reason);
    }
    return outcome;
}
