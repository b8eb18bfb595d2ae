# What is installed, and the packages: a .deb for Linux, a .zip for Windows.
include(GNUInstallDirs)
# What a user of the programs installs; the other component is dev, for those who build with the library.
set(CMAKE_INSTALL_DEFAULT_COMPONENT_NAME programs)

# fxprobe_install(PROGRAM…): the programs lie in one folder, where fxscan looks for FxProbe.
function(fxprobe_install)
    set(folder "${CMAKE_INSTALL_BINDIR}")
    if(WIN32)
        set(folder .)
    endif()
    install(TARGETS ${ARGV} EXPORT FxProbeTargets RUNTIME DESTINATION "${folder}")
endfunction()

# To pack the programs, only they need be built.
set(CMAKE_SKIP_INSTALL_ALL_DEPENDENCY ON)

set(CPACK_PACKAGE_NAME fxprobe)
set(CPACK_PACKAGE_VENDOR "The FxProbe authors")
set(CPACK_PACKAGE_CONTACT "The FxProbe authors <fxprobe@localhost>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "${PROJECT_DESCRIPTION}")
set(CPACK_COMPONENT_PROGRAMS_DESCRIPTION
    "FxProbe loads the VST 3, VST 2 and CLAP plug-ins of a machine, asks each for
its name, vendor and channels, and writes a catalogue that a workstation reads.
A plug-in that crashes or hangs is named with the reason and costs the
others nothing. fxscan does it from the command line.")
set(CPACK_PACKAGE_DIRECTORY "${PROJECT_BINARY_DIR}/packages")
set(CPACK_STRIP_FILES ON)
if(WIN32)
    set(CPACK_GENERATOR ZIP)
    set(CPACK_PACKAGE_FILE_NAME "fxprobe-${PROJECT_VERSION}-windows-x86_64")
    # The programs only.
    set(CPACK_INSTALL_CMAKE_PROJECTS "${PROJECT_BINARY_DIR};${PROJECT_NAME};programs;/")
else()
    set(CPACK_GENERATOR DEB)
    set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
    set(CPACK_DEBIAN_PACKAGE_SECTION sound)
    set(CPACK_DEB_COMPONENT_INSTALL ON)
    set(CPACK_COMPONENTS_ALL programs dev)
    set(CPACK_DEBIAN_PROGRAMS_PACKAGE_NAME fxprobe)
    set(CPACK_DEBIAN_PROGRAMS_PACKAGE_SHLIBDEPS ON)
    set(CPACK_DEBIAN_DEV_PACKAGE_NAME libfxprobe-dev)
    set(CPACK_DEBIAN_DEV_PACKAGE_SECTION libdevel)
    set(CPACK_DEBIAN_DEV_PACKAGE_DEPENDS "fxprobe (= ${PROJECT_VERSION}), qtbase5-dev, libpugixml-dev")
    set(CPACK_COMPONENT_DEV_DESCRIPTION "Library, headers and CMake package to build a workstation with FxProbe:
find_package(FxProbe), and a program of twenty lines scans, shows progress and
reads the catalogue. /usr/share/doc/libfxprobe-dev/examples has one.")
    set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
        OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
endif()

# The README and what it links, so that its links lead somewhere.
set(document_folder "${CMAKE_INSTALL_DATADIR}/doc/fxprobe")
if(WIN32)
    set(document_folder .)
    install(FILES "${PROJECT_SOURCE_DIR}/LICENSE" DESTINATION .)
endif()
install(FILES "${PROJECT_SOURCE_DIR}/README.md" "${PROJECT_SOURCE_DIR}/CHANGELOG.md"
    "${PROJECT_SOURCE_DIR}/cmake/debian/copyright" DESTINATION "${document_folder}")
install(DIRECTORY "${PROJECT_SOURCE_DIR}/docs" DESTINATION "${document_folder}"
    FILES_MATCHING PATTERN "*.md" PATTERN "*.png")

# What programs read lies apart from the documentation, which a system may leave out.
set(data_folder "${CMAKE_INSTALL_DATADIR}/fxprobe")
if(WIN32)
    set(data_folder docs)
endif()
install(FILES "${PROJECT_SOURCE_DIR}/docs/fxscan.schema.json" DESTINATION "${data_folder}")

if(NOT WIN32)
    # What Debian's tools look for. The text of the licence is on every Debian system; the link is the README's.
    set(debian_folder "${PROJECT_BINARY_DIR}/debian")
    configure_file("${PROJECT_SOURCE_DIR}/cmake/debian/changelog.in" "${debian_folder}/changelog" @ONLY)
    find_program(GZIP_PROGRAM gzip REQUIRED)
    execute_process(COMMAND "${GZIP_PROGRAM}" -fn9 "${debian_folder}/changelog" COMMAND_ERROR_IS_FATAL ANY)
    file(CREATE_LINK copyright "${debian_folder}/LICENSE" SYMBOLIC)
    file(CREATE_LINK ../../../fxprobe/fxscan.schema.json "${debian_folder}/fxscan.schema.json" SYMBOLIC)
    install(FILES "${debian_folder}/fxscan.schema.json" DESTINATION "${document_folder}/docs")
    install(FILES "${debian_folder}/changelog.gz" "${debian_folder}/LICENSE" DESTINATION "${document_folder}")
    set(dev_documents "${CMAKE_INSTALL_DATADIR}/doc/libfxprobe-dev")
    install(FILES "${debian_folder}/changelog.gz" "${PROJECT_SOURCE_DIR}/cmake/debian/copyright"
        DESTINATION "${dev_documents}" COMPONENT dev)
    install(DIRECTORY "${PROJECT_SOURCE_DIR}/examples" DESTINATION "${dev_documents}" COMPONENT dev)
endif()
include(CPack)
