#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFormat.h"

#include <QByteArray>

#include <optional>
#include <vector>

/// A catalogue file read by its lines.
struct CatalogueLines {
    std::optional<QString> version;
    std::vector<EffectRecord> records; ///< in the order of the file
    bool isAsWritten = true;           ///< false: in the way of another system, or with elements left out
    bool isWhole = false; ///< false: some line is not as we write it; the records before it are there
};

/// Reads a catalogue that has the layout in which we write it. Texts in it are not escaped, so a name that
/// holds "<" makes the file something that no XML reader takes, or takes for something else: what we wrote is
/// read as we wrote it.
CatalogueLines readCatalogueLines(const CatalogueFormat &format, const QByteArray &content);
/// Reads the same after an editor, or damage: with other white space and line ends, comments, other elements,
/// or elements in another order. Each line is read by itself: where one does not fit, its neighbours stay,
/// and the catalogue is not whole. A record without an end is left out, and so is one that does not tell
/// whether it may be used.
CatalogueLines readEditedLines(const CatalogueFormat &format, const QByteArray &content);

/// Reads the folders of a scan list that has our layout. False, and no folders, when it has another.
bool readScanListLines(const QByteArray &content, QStringList &folders);
