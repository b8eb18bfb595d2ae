#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFormat.h"

/// The VST 2 catalogue file: one record per plug-in, or per sub-plug-in of a shell.
const CatalogueFormat &vstCatalogueFormat();
