#include "Main/AudioEngineController/Effects/Catalogue/VSTCatalogue.h"

#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"

namespace {

using Content = std::optional<QByteArray>;

template <qint32 EffectRecord::*Field>
void readNumber(EffectRecord &record, const ElementContent &element)
{
    record.*Field = CatalogueElements::readInt(element);
}

template <qint32 EffectRecord::*Field>
Content number(const EffectRecord &record)
{
    return QByteArray::number(record.*Field);
}

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
        true, // the output channels
        {".scan", true, true},
        {kPath,
         kFileTime,
         kName,
         kId,
         {"Category", readNumber<&EffectRecord::vstCategory>, number<&EffectRecord::vstCategory>},
         kCategoryMask,
         kFavourite,
         kVendor,
         {"Width", readNumber<&EffectRecord::width>, number<&EffectRecord::width>},
         {"Latency", readNumber<&EffectRecord::latency>,
          nullptr}, // read from other writers' files, never written
         kEnabled,
         kWorking,
         {"SubEffect", readSubEffect, subEffect}}};
    return format;
}
