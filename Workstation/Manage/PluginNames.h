#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"

#include <QString>
#include <QStringList>

#include <vector>

/// What a name that a user gave means.
struct NamedPlugins {
    std::vector<std::size_t> places; ///< of the records that are meant, among those that were given
    QStringList files;               ///< the paths in which they lie, each once

    bool isAmbiguous() const { return files.size() > 1; }
    /// "several plug-ins are named 'Comp'; use the path of one:" and the paths, one a line.
    QString question(const QString &name) const;
};

/// Finds what a name means among some records: a file's path (absolute or from the working folder, also that
/// of the bundle around it), else the name of a plug-in or of a file, else the same whatever the case and the
/// blanks around it, else the name of a file without its ending. A file stands for all that is in it, and so
/// does the record of a whole file.
NamedPlugins pluginsNamed(const QString &name, const std::vector<const EffectRecord *> &records);

/// True when the name means the file of this path.
bool isFileNamed(const QString &name, const QString &path);

/// What is remembered of the files that a name means and that the catalogue does not list.
struct UnlistedFile {
    QString reason;          ///< "PATH: why"; empty when there is no such file
    QStringList usedInstead; ///< the files that list what is in it: it is a copy
};
UnlistedFile unlistedFileNamed(const QString &name, const ProbeMemory &memory);
