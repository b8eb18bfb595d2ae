#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"

#include <QByteArray>
#include <QSet>

#include <map>

/// A record that came into a catalogue. It is rendered once, however many times the file is written.
class ListedEffect {
public:
    ListedEffect() = default;
    explicit ListedEffect(EffectRecord listed)
        : record(std::move(listed))
    {}

    EffectRecord record;
    bool ownsName = false;    ///< the name counts as used because of this record
    bool isHidden = false;    ///< no file is to hold it yet: whose marks it gets is not settled
    bool isUnsettled = false; ///< another of its file is hidden: it is written without the file's time

    /// The record's text in a format's catalogue file.
    const QByteArray &text(const CatalogueFormat &format)
    {
        if (m_rendered.isNull()) {
            EffectRecord untimed;
            if (isUnsettled) {
                untimed = record;
                untimed.fileTime.clear();
            }
            m_rendered = renderRecord(format, isUnsettled ? untimed : record);
        }
        return m_rendered;
    }
    /// To be called when the record was changed.
    void forgetText() { m_rendered = QByteArray(); }

private:
    QByteArray m_rendered;
};

/// Old records of files that still wait for their probe, sorted by identifier: interim writes carry them, so
/// that a crash in the middle costs no user marks.
using WaitingRecords = std::multimap<QString, ListedEffect>;

/// The records of one run, sorted by identifier, each identifier once; and the names that they use.
class EffectList {
public:
    using Entries = std::map<QString, ListedEffect>;

    void clear();
    std::size_t size() const { return m_entries.size(); }
    const Entries &entries() const { return m_entries; }
    Entries &entries() { return m_entries; }

    /// The record that holds the identifier, or null.
    const EffectRecord *find(const QString &id) const;

    /// Adds a record unless its identifier is empty or held. A record whose name is used gets one made from
    /// its path, which does not count as used.
    bool add(const EffectRecord &record);
    /// Sets the user's mark on a record; nothing for an identifier that is not there.
    void setFavourite(const QString &id, bool favourite);
    /// Has a record take over the user's marks of an old one; nothing for an identifier that is not there.
    void passMarks(const EffectRecord &old, const QString &id);
    /// Has files not hold a record, or hold it again; nothing for an identifier that is not there.
    void setHidden(const QString &id, bool isHidden);
    /// Has files hold a record so that its file is asked again, or not; nothing for an identifier that is not
    /// there.
    void setUnsettled(const QString &id, bool isUnsettled);
    /// Takes a record out, and its name.
    void remove(const QString &id);

private:
    Entries m_entries;
    QSet<QString> m_names;
};
