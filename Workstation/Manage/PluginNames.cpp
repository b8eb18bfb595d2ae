#include "Workstation/Manage/PluginNames.h"

#include "Core/BaseLib/Files/NativeFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <QDir>
#include <QFileInfo>

#include <algorithm>
#include <set>

namespace {

/// How well a name fits, the best first.
enum class Fit { Path, Exact, Alike, Base, None };

bool isPath(const QString &name, const QString &path)
{
    const QString absolute = QDir::cleanPath(QFileInfo(name).absoluteFilePath());
    return isSamePath(path, absolute) || isSamePath(bundleOf(path), absolute);
}

Fit fitOf(const QString &name, const QString &text)
{
    if (text == name)
        return Fit::Exact;
    // Who types a name sees no blanks at its ends.
    return text.trimmed().compare(name.trimmed(), Qt::CaseInsensitive) == 0 ? Fit::Alike : Fit::None;
}

Fit fitOfFile(const QString &name, const QString &path)
{
    if (isPath(name, path))
        return Fit::Path;
    EffectRecord file;
    file.path = path;
    NameFromPath(file);
    return std::min(fitOf(name, fileNameOf(path)),
                    fitOf(name, file.name) == Fit::None ? Fit::None : Fit::Base);
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

bool isFileNamed(const QString &name, const QString &path) { return fitOfFile(name, path) != Fit::None; }

UnlistedFile unlistedFileNamed(const QString &name, const ProbeMemory &memory)
{
    UnlistedFile file;
    for (const PluginFormatInfo &format : pluginFormats())
        memory.forEach(format.format, [&](const RememberedProbe &probe) {
            if (!isFileNamed(name, probe.path))
                return;
            file.reason = QStringLiteral("%1: %2").arg(
                probe.path, probe.reason.isEmpty()
                                ? QStringLiteral("nothing is known of it any more; scan it again")
                                : probe.reason);
            for (const RememberedPlugin &plugin : probe.plugins)
                if (!plugin.heldBy.isEmpty() && !file.usedInstead.contains(plugin.heldBy))
                    file.usedInstead.append(plugin.heldBy);
        });
    return file;
}
