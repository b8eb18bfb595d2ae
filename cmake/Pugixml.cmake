# pugixml, linked statically: a plug-in that carries a copy of its own must neither find ours nor replace it.
find_path(PUGIXML_INCLUDE_DIR pugixml.hpp REQUIRED)
find_library(PUGIXML_STATIC_LIBRARY NAMES libpugixml.a REQUIRED)
add_library(FxProbe::pugixml STATIC IMPORTED)
set_target_properties(FxProbe::pugixml PROPERTIES
    IMPORTED_LOCATION "${PUGIXML_STATIC_LIBRARY}"
    INTERFACE_INCLUDE_DIRECTORIES "${PUGIXML_INCLUDE_DIR}")
if(NOT WIN32)
    set_property(TARGET FxProbe::pugixml PROPERTY INTERFACE_LINK_OPTIONS "LINKER:--exclude-libs,libpugixml.a")
endif()
