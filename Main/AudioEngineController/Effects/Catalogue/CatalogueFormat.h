#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/Catalogue/ElementContent.h"
#include "Main/AudioEngineController/Effects/Catalogue/KnownList.h"

#include <QByteArray>

#include <optional>
#include <vector>

/// One element of a catalogue record: how it is read and how it is written. Either may be missing.
struct CatalogueElement {
    const char *name;
    /// Takes the element's value into the record; called only when the element is present.
    void (*read)(EffectRecord &record, const ElementContent &element);
    /// The element's content as UTF-8, unescaped; nothing leaves the whole element out.
    std::optional<QByteArray> (*content)(const EffectRecord &record);
};

/// What a format's crash markers look like.
struct MarkerFormat {
    const char *ending;  ///< end of the file's name, with its dot
    bool leavesOutEmpty; ///< no Path or Created line when there is no path or time
    bool hasSubId;       ///< carries the identifier of a sub-plug-in
};

/// A format's catalogue file: its name, its version, and the elements of a record in the order in which they
/// are written.
struct CatalogueFormat {
    const char *fileName;        ///< appended to the catalogue folder, leading "/" included
    const char *version;         ///< the version attribute that is written
    bool versionRequired;        ///< a file without a version yields no records; otherwise it counts as 1.0
    double fileTimesTrustedFrom; ///< files of earlier versions carry time stamps of another form
    double categoryMasksFrom;    ///< in files of earlier versions the mask is not one yet
    /// What tells the plug-ins of one file apart.
    KnownList::Identity identity;
    /// What identifiers of plug-ins look like, as a regular expression over all of one; null: there are none
    /// to mistake. No path of a file may match.
    const char *identifierForm;
    /// Which channels a record tells: of inputs, if any, of outputs as the width, or of both.
    enum class Channels { Inputs, Width, Both } channels;
    bool isWrittenEmpty; ///< a scan that finds nothing writes the file, also where there is none
    MarkerFormat marker;
    std::vector<CatalogueElement> elements;
};

/// Elements that several formats share.
namespace CatalogueElements {
extern const CatalogueElement kPath;
extern const CatalogueElement kFileTime;
extern const CatalogueElement kName;
extern const CatalogueElement kId;
extern const CatalogueElement kCategoryMask;
extern const CatalogueElement kFavourite;
extern const CatalogueElement kVendor;
extern const CatalogueElement kInputs;
extern const CatalogueElement kOutputs;
extern const CatalogueElement kEnabled;
extern const CatalogueElement kWorking;

inline qint32 readInt(const ElementContent &element) { return static_cast<qint32>(element.integer()); }
inline bool readBool(const ElementContent &element) { return element.integer() != 0; }

/// An element that holds a field of the record as it is.
template <QString EffectRecord::*Field>
constexpr CatalogueElement textElement(const char *name)
{
    return {name, [](EffectRecord &record, const ElementContent &element) { record.*Field = element.text(); },
            [](const EffectRecord &record) -> std::optional<QByteArray> { return (record.*Field).toUtf8(); }};
}

template <qint32 EffectRecord::*Field>
constexpr CatalogueElement numberElement(const char *name)
{
    return {name,
            [](EffectRecord &record, const ElementContent &element) { record.*Field = readInt(element); },
            [](const EffectRecord &record) -> std::optional<QByteArray> {
                return QByteArray::number(record.*Field);
            }};
}
} // namespace CatalogueElements
