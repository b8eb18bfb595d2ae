#pragma once

#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFormat.h"

/// CLAPConfiguration.xml: the plug-ins of CLAP modules.
const CatalogueFormat &clapCatalogueFormat();
