#include "Main/AudioEngineController/Effects/Catalogue/VST3Catalogue.h"

#include <limits>

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
        "[0-9A-Fa-f]{32}", // a class id
        CatalogueFormat::Channels::Inputs,
        true,
        {".scan3", false, false},
        {kPath,
         kFileTime,
         kName,
         kId,
         textElement<&EffectRecord::categories>("Categories"),
         kCategoryMask,
         kFavourite,
         kVendor,
         kInputs,
         // NOTE: the number of inputs. Files in the field and the workstation's reader expect it so.
         {kOutputs.name, kOutputs.read, kInputs.content},
         kEnabled,
         kWorking}};
    return format;
}
