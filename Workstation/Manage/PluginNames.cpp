#include "Workstation/Manage/PluginNames.h"

#include "Core/BaseLib/Files/NativeFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <QDir>
#include <QFileInfo>

#include <algorithm>
#include <set>

namespace {

/// How well a name fits, the best first.
enum class Fit { Path, Exact, AnyCase, None };

bool isPath(const QString &name, const QString &path)
{
    const QString absolute = QDir::cleanPath(QFileInfo(name).absoluteFilePath());
    return isSamePath(path, absolute) || isSamePath(bundleOf(path), absolute);
}

Fit fitOf(const QString &name, const QString &text)
{
    if (text == name)
        return Fit::Exact;
    return text.compare(name, Qt::CaseInsensitive) == 0 ? Fit::AnyCase : Fit::None;
}

Fit fitOfFile(const QString &name, const QString &path)
{
    return isPath(name, path) ? Fit::Path : fitOf(name, fileNameOf(path));
}

} // namespace

QString NamedPlugins::question(const QString &name) const
{
    return QStringLiteral("several plug-ins are named '%1'; use the path of one:\n  ").arg(name) +
           files.join(QLatin1String("\n  "));
}

NamedPlugins pluginsNamed(const QString &name, const std::vector<const EffectRecord *> &records)
{
    Fit best = Fit::None;
    std::vector<Fit> own(records.size());
    std::vector<Fit> ofFile(records.size());
    for (std::size_t place = 0; place < records.size(); ++place) {
        own[place] = fitOf(name, records[place]->name);
        ofFile[place] = fitOfFile(name, records[place]->path);
        if (records[place]->standsForFile())
            ofFile[place] = std::min(ofFile[place], own[place]);
        best = std::min({best, own[place], ofFile[place]});
    }
    NamedPlugins named;
    std::set<QString, PathLess> files;
    std::set<QString, PathLess> wholeFiles;
    for (std::size_t place = 0; place < records.size() && best != Fit::None; ++place) {
        if (std::min(own[place], ofFile[place]) == best)
            files.insert(records[place]->path);
        if (ofFile[place] == best)
            wholeFiles.insert(records[place]->path);
    }
    for (std::size_t place = 0; place < records.size() && best != Fit::None; ++place)
        if (own[place] == best || wholeFiles.count(records[place]->path) != 0)
            named.places.push_back(place);
    for (const QString &file : files)
        named.files.append(file);
    return named;
}

bool isFileNamed(const QString &name, const QString &path)
{
    EffectRecord file;
    file.path = path;
    NameFromPath(file);
    return fitOfFile(name, path) != Fit::None || fitOf(name, file.name) != Fit::None;
}
