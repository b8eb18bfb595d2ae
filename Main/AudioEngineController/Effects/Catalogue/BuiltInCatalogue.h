#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFormat.h"

/// The file of the user's marks on built-in effects.
const CatalogueFormat &builtInEffectsFormat();
