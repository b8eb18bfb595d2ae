#pragma once

#include "Core/BaseLib/Files/TextFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFormat.h"

#include <vector>

/// What a catalogue file held.
struct CatalogueContents {
    QString reason;                    ///< why the file could not be used; empty when it was
    std::vector<EffectRecord> records; ///< in the order of the file
    bool isUnread = false;             ///< the file is there, but the system did not let it be read
    bool isBroken = false;             ///< it is no XML; what it holds can be salvaged at best
    bool upgraded = false;             ///< an earlier version, whose records were changed while reading

    explicit operator bool() const { return reason.isEmpty(); }
};

/// Reads a catalogue file, upgrading records of earlier versions.
CatalogueContents readCatalogueFile(const CatalogueFormat &format, const QString &path);

/// The records of a catalogue that is no XML (texts are not escaped, and a plug-in's name may hold "<"), read
/// by its lines.
std::vector<EffectRecord> salvageRecords(const CatalogueFormat &format, const QString &path);

/// A record as the catalogue file holds it, line ends included. Nothing is escaped: the files' other readers
/// and writers do not expect it.
QByteArray renderRecord(const CatalogueFormat &format, const EffectRecord &record);

/// A whole catalogue file made of rendered records.
QByteArray renderCatalogue(const CatalogueFormat &format, const std::vector<const QByteArray *> &records);
/// The same of records that are rendered for it.
QByteArray renderCatalogue(const CatalogueFormat &format, const std::vector<EffectRecord> &records);

/// The line every file of ours starts with, its end included.
QByteArray xmlHeaderLine();
/// `indent` tabs, the element with its unescaped content, and the line end.
QByteArray elementLine(int indent, const char *name, const QByteArray &content);
