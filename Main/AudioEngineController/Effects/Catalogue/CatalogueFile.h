#pragma once

#include "Core/BaseLib/Files/TextFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFormat.h"

#include <functional>
#include <vector>

/// What a catalogue file held.
struct CatalogueContents {
    QString reason;                    ///< why the file could not be used; empty when it was
    std::vector<EffectRecord> records; ///< in the order of the file
    bool isUnread = false;             ///< the file is there, but the system did not let it be read
    bool isAsWritten = false; ///< of this version and in our layout: written again, it would be the same

    explicit operator bool() const { return reason.isEmpty(); }
};

/// Gives the time stamp of a module's file.
using FileTimeOf = std::function<QString(const QString &path)>;

/// Reads a catalogue file: by its lines where it has the layout in which it is written, as XML where it has
/// another. Records of earlier versions are upgraded: their time stamps, which were of another form, become
/// those of the files now, or none where `fileTimeOf` is null. Where the file is damaged, the records that
/// can be read are there, those of plug-ins that work without time stamps.
CatalogueContents readCatalogueFile(const CatalogueFormat &format, const QString &path,
                                    const FileTimeOf &fileTimeOf = nullptr);

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
