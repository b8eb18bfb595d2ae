#pragma once

#include "Core/BaseLib/Files/TextFile.h"
#include "Workstation/ScanAccount.h"

/// Remembers between scans why plug-ins cannot be used: the catalogue has no place for it, and what did not
/// change is not probed again. One JSON file in the data folder; a reason counts for one version of a file.
class ReasonStore {
public:
    /// Knows no reasons.
    ReasonStore() = default;
    /// Reads the file; one that is missing or damaged holds no reasons.
    explicit ReasonStore(const QString &file);

    /// The reason why this version of a plug-in failed; empty when nobody knows.
    QString find(const PluginKey &key, const QString &fileTime) const;
    void set(const PluginKey &key, const QString &fileTime, const QString &reason);
    /// Replaces the file by what was set.
    FileResult write(const QString &file) const;

private:
    struct Entry {
        QString fileTime;
        QString reason;
    };
    std::map<PluginKey, Entry> m_entries;
};
