#include "Main/AudioEngineController/Effects/Catalogue/BuiltInCatalogue.h"

#include <limits>

const CatalogueFormat &builtInEffectsFormat()
{
    using namespace CatalogueElements;
    static const CatalogueElement writtenMask = {kCategoryMask.name, nullptr, kCategoryMask.content};
    // There are no files whose times could be read: no version, not even a negative one, is upgraded.
    constexpr double kEveryVersion = -std::numeric_limits<double>::infinity();
    static const CatalogueFormat format = {"/TesselFXConfiguration.xml",
                                           "1.2",
                                           false,
                                           kEveryVersion,
                                           kEveryVersion,
                                           KnownList::Identity::Identifier,
                                           nullptr,
                                           CatalogueFormat::Channels::Inputs, // none are told
                                           false,
                                           {},
                                           {kId, kFavourite, writtenMask}};
    return format;
}
