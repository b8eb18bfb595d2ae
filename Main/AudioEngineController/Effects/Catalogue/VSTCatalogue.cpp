#include "Main/AudioEngineController/Effects/Catalogue/VSTCatalogue.h"

#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"

namespace {

using Content = std::optional<QByteArray>;

void readSubEffect(EffectRecord &record, const ElementContent &element)
{
    record.subName = element.child("Name").text();
    record.subId = static_cast<quint32>(element.child("ID").integer());
}

/// The nested block, from behind its opening tag to before its closing one.
Content subEffect(const EffectRecord &record)
{
    if (record.subId == 0)
        return std::nullopt;
    return kLineEnd + elementLine(3, "Name", record.subName.toUtf8()) +
           elementLine(3, "ID", QByteArray::number(record.subId)) + "\t\t";
}

} // namespace

const CatalogueFormat &vstCatalogueFormat()
{
    using namespace CatalogueElements;
    static const CatalogueFormat format = {
        "/FXConfiguration.xml",
        "1.4",
        true, // a file that states no version is older than any that can be read
        1.4,
        1.3,
        KnownList::Identity::SubPlugin,
        "[^/]*:-?\\d+", // a key: name and unique id
        CatalogueFormat::Channels::Width,
        true,
        {".scan", true, true},
        {kPath,
         kFileTime,
         kName,
         kId,
         numberElement<&EffectRecord::vstCategory>("Category"),
         kCategoryMask,
         kFavourite,
         kVendor,
         numberElement<&EffectRecord::width>("Width"),
         {"Latency", numberElement<&EffectRecord::latency>("Latency").read,
          nullptr}, // read from other writers' files, never written
         kEnabled,
         kWorking,
         {"SubEffect", readSubEffect, subEffect}}};
    return format;
}
