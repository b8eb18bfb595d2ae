#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFormat.h"

/// The VST 3 catalogue file: one record per audio class.
const CatalogueFormat &vst3CatalogueFormat();
