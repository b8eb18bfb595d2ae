#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFormat.h"

#include "Main/AudioEngineController/Effects/Catalogue/CategoryTable.h"

namespace {

using Content = std::optional<QByteArray>;

template <bool EffectRecord::*Field>
constexpr CatalogueElement boolElement(const char *name)
{
    return {name,
            [](EffectRecord &record, const ElementContent &element) {
                record.*Field = CatalogueElements::readBool(element);
            },
            [](const EffectRecord &record) -> Content { return QByteArray(record.*Field ? "1" : "0"); }};
}

void readCategoryMask(EffectRecord &record, const ElementContent &element)
{
    const auto mask = static_cast<quint32>(CatalogueElements::readInt(element));
    record.category = CategoryTable::instance().maskToCategory(mask);
}

Content categoryMask(const EffectRecord &record)
{
    return QByteArray::number(static_cast<qint32>(CategoryTable::instance().categoryToMask(record.category)));
}

} // namespace

const CatalogueElement CatalogueElements::kPath = textElement<&EffectRecord::path>("Path");
const CatalogueElement CatalogueElements::kFileTime = textElement<&EffectRecord::fileTime>("FileTime");
const CatalogueElement CatalogueElements::kName = textElement<&EffectRecord::name>("Name");
const CatalogueElement CatalogueElements::kId = textElement<&EffectRecord::id>("ID");
const CatalogueElement CatalogueElements::kCategoryMask = {"CategoryMask", readCategoryMask, categoryMask};
const CatalogueElement CatalogueElements::kFavourite = boolElement<&EffectRecord::favourite>("Favourite");
const CatalogueElement CatalogueElements::kVendor = textElement<&EffectRecord::vendor>("Vendor");
const CatalogueElement CatalogueElements::kInputs = numberElement<&EffectRecord::inputs>("Inputs");
const CatalogueElement CatalogueElements::kOutputs = numberElement<&EffectRecord::outputs>("Outputs");
const CatalogueElement CatalogueElements::kEnabled = boolElement<&EffectRecord::enabled>("Enabled");
const CatalogueElement CatalogueElements::kWorking = boolElement<&EffectRecord::working>("Working");
