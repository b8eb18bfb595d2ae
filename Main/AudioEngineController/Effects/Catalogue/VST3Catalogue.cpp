#include "Main/AudioEngineController/Effects/Catalogue/VST3Catalogue.h"

#include <limits>

namespace {

using Content = std::optional<QByteArray>;

void readInputs(EffectRecord &record, const ElementContent &element)
{
    record.inputs = CatalogueElements::readInt(element);
}

void readOutputs(EffectRecord &record, const ElementContent &element)
{
    record.outputs = CatalogueElements::readInt(element);
}

void readCategories(EffectRecord &record, const ElementContent &element)
{
    record.categories = element.text();
}

Content inputs(const EffectRecord &record) { return QByteArray::number(record.inputs); }

Content categories(const EffectRecord &record) { return record.categories.toUtf8(); }

} // namespace

const CatalogueFormat &vst3CatalogueFormat()
{
    using namespace CatalogueElements;
    static const CatalogueFormat format = {
        "/VST3Configuration.xml",
        "1.1",
        false,
        1.1,
        std::numeric_limits<double>::lowest(), // masks in every version
        KnownList::Identity::Identifier,
        false, // the input channels
        {".scan3", false, false},
        {kPath,
         kFileTime,
         kName,
         kId,
         {"Categories", readCategories, categories},
         kCategoryMask,
         kFavourite,
         kVendor,
         {"Inputs", readInputs, inputs},
         // NOTE: the number of inputs. Files in the field and the workstation's reader expect it so.
         {"Outputs", readOutputs, inputs},
         kEnabled,
         kWorking}};
    return format;
}
