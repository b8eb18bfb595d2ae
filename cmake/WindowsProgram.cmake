# fxprobe_screenless(TARGET): a program that is linked with a static Qt brings the platform along that needs no screen.
function(fxprobe_screenless target)
    qt5_import_plugins(${target} INCLUDE Qt5::QOffscreenIntegrationPlugin)
endfunction()

# fxprobe_windows_program(TARGET DESCRIPTION): gives a program its version, icon and manifest. Does nothing on other
# systems.
function(fxprobe_windows_program target description)
    if(NOT WIN32)
        return()
    endif()
    set(source_folder "${PROJECT_SOURCE_DIR}/cmake/windows")
    set(resource_folder "${CMAKE_CURRENT_BINARY_DIR}/${target}.resources")
    configure_file("${source_folder}/program.rc.in" "${resource_folder}/program.rc" @ONLY)
    configure_file("${source_folder}/program.manifest.in" "${resource_folder}/program.manifest" @ONLY)
    configure_file("${source_folder}/FxProbe.ico" "${resource_folder}/program.ico" COPYONLY)
    target_sources(${target} PRIVATE "${resource_folder}/program.rc")
    set_source_files_properties("${resource_folder}/program.rc" PROPERTIES
        INCLUDE_DIRECTORIES "${resource_folder}"
        OBJECT_DEPENDS "${resource_folder}/program.manifest;${resource_folder}/program.ico")
endfunction()
