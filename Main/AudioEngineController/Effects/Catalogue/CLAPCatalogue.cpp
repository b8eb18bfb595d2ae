#include "Main/AudioEngineController/Effects/Catalogue/CLAPCatalogue.h"

#include <limits>

namespace {

void readId(EffectRecord &record, const ElementContent &element)
{
    record.id = element.text();
    record.hasFreeId = true;
}

} // namespace

const CatalogueFormat &clapCatalogueFormat()
{
    using namespace CatalogueElements;
    static const CatalogueFormat format = {"/CLAPConfiguration.xml",
                                           "1.0",
                                           false,
                                           1.0,
                                           std::numeric_limits<double>::lowest(), // masks in every version
                                           KnownList::Identity::Identifier,
                                           "[^/]*", // any text: a file is identified by its path
                                           CatalogueFormat::Channels::Both,
                                           false,
                                           {".scanclap", false, false},
                                           {kPath,
                                            kFileTime,
                                            kName,
                                            {kId.name, readId, kId.content},
                                            textElement<&EffectRecord::categories>("Features"),
                                            kCategoryMask,
                                            kFavourite,
                                            kVendor,
                                            textElement<&EffectRecord::version>("Version"),
                                            kInputs,
                                            kOutputs,
                                            kEnabled,
                                            kWorking}};
    return format;
}
