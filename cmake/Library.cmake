# The library for a workstation: one archive of all rooms that it needs, its headers, and a CMake package.
include(CMakePackageConfigHelpers)

# Where the headers lie in the tree. They are installed below include/FxProbe, the first ones right there.
set(FXPROBE_FACE Workstation/Library/Scan.h)

# collect_rooms(TARGET): the libraries of ours that a target is made of, in the global property FXPROBE_ROOMS, and those of others
# that they need, in FXPROBE_NEEDED.
function(collect_rooms target)
    get_property(rooms GLOBAL PROPERTY FXPROBE_ROOMS)
    if(target IN_LIST rooms)
        return()
    endif()
    set_property(GLOBAL APPEND PROPERTY FXPROBE_ROOMS ${target})
    get_property(libraries TARGET ${target} PROPERTY LINK_LIBRARIES)
    foreach(library IN LISTS libraries)
        set(type "")
        if(TARGET ${library})
            get_target_property(type ${library} TYPE)
            get_target_property(is_imported ${library} IMPORTED)
        endif()
        if(NOT type OR is_imported)
            set_property(GLOBAL APPEND PROPERTY FXPROBE_NEEDED ${library})
        elseif(type STREQUAL "STATIC_LIBRARY")
            collect_rooms(${library})
        endif()
    endforeach()
endfunction()

# Everything below the command line. The VST 3 SDK is in it: who links the library needs no SDK.
collect_rooms(workstation_library)
get_property(rooms GLOBAL PROPERTY FXPROBE_ROOMS)
get_property(needed GLOBAL PROPERTY FXPROBE_NEEDED)
list(REMOVE_DUPLICATES needed)
list(REMOVE_ITEM needed Qt5::Core Threads::Threads)
list(TRANSFORM rooms REPLACE "(.+)" "$<TARGET_OBJECTS:\\1>" OUTPUT_VARIABLE objects)
add_library(library STATIC ${objects})
set_target_properties(library PROPERTIES OUTPUT_NAME fxprobe EXPORT_NAME FxProbe LINKER_LANGUAGE CXX)
target_compile_features(library INTERFACE cxx_std_17)
target_include_directories(library INTERFACE "$<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>")
target_link_libraries(library PUBLIC Qt5::Core Threads::Threads PRIVATE ${needed})

set(package_folder "${CMAKE_INSTALL_LIBDIR}/cmake/FxProbe")
configure_package_config_file("${PROJECT_SOURCE_DIR}/cmake/FxProbeConfig.cmake.in" "${PROJECT_BINARY_DIR}/FxProbeConfig.cmake"
    INSTALL_DESTINATION "${package_folder}" NO_SET_AND_CHECK_MACRO)
# Until 1.0 any release may change what is declared.
write_basic_package_version_file("${PROJECT_BINARY_DIR}/FxProbeConfigVersion.cmake" COMPATIBILITY SameMinorVersion)
install(TARGETS library EXPORT FxProbeTargets ARCHIVE DESTINATION "${CMAKE_INSTALL_LIBDIR}" COMPONENT dev)
install(EXPORT FxProbeTargets NAMESPACE FxProbe:: DESTINATION "${package_folder}" COMPONENT dev)
install(FILES "${PROJECT_BINARY_DIR}/FxProbeConfig.cmake" "${PROJECT_BINARY_DIR}/FxProbeConfigVersion.cmake"
    "${PROJECT_SOURCE_DIR}/cmake/Pugixml.cmake" DESTINATION "${package_folder}" COMPONENT dev)
install(FILES ${FXPROBE_FACE} DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}/FxProbe" COMPONENT dev)

# The pages that describe the headers. A public declaration without a comment is an error.
find_package(Doxygen QUIET)
if(DOXYGEN_FOUND)
    set(DOXYGEN_OUTPUT_DIRECTORY "${PROJECT_BINARY_DIR}/api")
    set(DOXYGEN_HTML_OUTPUT .)
    set(DOXYGEN_USE_MDFILE_AS_MAINPAGE "${PROJECT_SOURCE_DIR}/docs/api.md")
    set(DOXYGEN_EXAMPLE_PATH "${PROJECT_SOURCE_DIR}/examples")
    set(DOXYGEN_STRIP_FROM_INC_PATH "${PROJECT_SOURCE_DIR}/Workstation/Library")
    set(DOXYGEN_EXTRACT_ALL NO)
    set(DOXYGEN_WARN_AS_ERROR FAIL_ON_WARNINGS)
    set(DOXYGEN_JAVADOC_AUTOBRIEF YES)
    set(DOXYGEN_HAVE_DOT NO)
    set(DOXYGEN_QUIET YES)
    list(TRANSFORM FXPROBE_FACE PREPEND "${PROJECT_SOURCE_DIR}/" OUTPUT_VARIABLE documented)
    doxygen_add_docs(api ${documented} "${PROJECT_SOURCE_DIR}/docs/api.md")
endif()
