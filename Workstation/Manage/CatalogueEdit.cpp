#include "Workstation/Manage/CatalogueEdit.h"

#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"

#include <QFile>

#include <algorithm>
#include <iterator>
#include <set>

CatalogueEdit::CatalogueEdit(const QString &effectsFolder)
{
    for (const PluginFormatInfo &format : pluginFormats()) {
        const QString path =
            format.isScanned() ? effectsFolder + QLatin1String(format.catalogue->fileName) : QString();
        if (!QFile::exists(path))
            continue;
        CatalogueContents contents = readCatalogueFile(*format.catalogue, path);
        m_catalogues.push_back({&format, path, contents.reason, contents.records, contents.records});
    }
    for (Catalogue &catalogue : m_catalogues) {
        std::set<QString, PathLess> described; // by records of what is in the file
        for (const EffectRecord &record : catalogue.records)
            if (!record.standsForFile())
                described.insert(record.path);
        for (EffectRecord &record : catalogue.records)
            m_plugins.push_back(
                {catalogue.format, &record, record.standsForFile() && described.count(record.path) != 0});
    }
}

std::vector<CatalogueEdit::Plugin> CatalogueEdit::pluginsOf(const PluginFormatInfo &format,
                                                            const QString &path) const
{
    std::vector<Plugin> plugins;
    std::copy_if(m_plugins.begin(), m_plugins.end(), std::back_inserter(plugins), [&](const Plugin &each) {
        return each.format == &format && isSamePath(each.record->path, path);
    });
    return plugins;
}

FileResult CatalogueEdit::write()
{
    FileResult result;
    for (Catalogue &catalogue : m_catalogues) {
        if (catalogue.records == catalogue.before)
            continue;
        const FileResult written =
            catalogue.unread.isEmpty()
                ? replaceFile(catalogue.path,
                              renderCatalogue(*catalogue.format->catalogue, catalogue.records),
                              Durability::Synced)
                : FileResult{QStringLiteral("it cannot be read as a whole, and a scan makes it anew: ") +
                             catalogue.unread};
        if (written)
            catalogue.before = catalogue.records;
        else
            result.reason = QStringLiteral("%1: %2").arg(catalogue.path, written.reason);
    }
    return result;
}
