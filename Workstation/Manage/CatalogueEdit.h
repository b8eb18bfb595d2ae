#pragma once

#include "Core/BaseLib/Files/TextFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"

#include <vector>

/// The catalogues of an Effects folder, read to be changed. Whoever uses it has the locks of that folder.
class CatalogueEdit {
public:
    /// One record, and whose it is.
    struct Plugin {
        const PluginFormatInfo *format;
        EffectRecord *record; ///< as long as the edit lives
        /// It stands for its whole file beside records of what is in it: people see only these.
        bool isHidden;
    };

    /// Reads the catalogues that are there.
    explicit CatalogueEdit(const QString &effectsFolder);

    /// All records, in the order of the formats and files.
    const std::vector<Plugin> &plugins() const { return m_plugins; }
    /// Those of one file.
    std::vector<Plugin> pluginsOf(const PluginFormatInfo &format, const QString &path) const;

    /// Replaces the catalogues whose records changed. One that could not be read as a whole is not replaced,
    /// which is a failure: the rest of it would be lost.
    FileResult write();

private:
    struct Catalogue {
        const PluginFormatInfo *format;
        QString path;
        QString unread; ///< why it could not be read as a whole; empty when it was
        std::vector<EffectRecord> records;
        std::vector<EffectRecord> before; ///< as they were read
    };

    std::vector<Catalogue> m_catalogues;
    std::vector<Plugin> m_plugins;
};
