# What is installed, and the packages: a .deb for Linux, a .zip for Windows.
include(GNUInstallDirs)

# fxprobe_install(PROGRAM…): the programs lie in one folder, where fxscan looks for FxProbe.
function(fxprobe_install)
    if(WIN32)
        install(TARGETS ${ARGV} RUNTIME DESTINATION .)
    else()
        install(TARGETS ${ARGV} RUNTIME DESTINATION "${CMAKE_INSTALL_BINDIR}")
    endif()
endfunction()

# To pack the programs, only they need be built.
set(CMAKE_SKIP_INSTALL_ALL_DEPENDENCY ON)

set(document_folder "${CMAKE_INSTALL_DATADIR}/doc/fxprobe")
set(licence_name copyright) # where Debian's users look for it
if(WIN32)
    set(document_folder .)
    set(licence_name LICENSE.txt)
endif()
install(FILES "${PROJECT_SOURCE_DIR}/LICENSE" DESTINATION "${document_folder}" RENAME ${licence_name})
install(FILES "${PROJECT_SOURCE_DIR}/README.md" "${PROJECT_SOURCE_DIR}/CHANGELOG.md" DESTINATION "${document_folder}")

set(CPACK_PACKAGE_NAME fxprobe)
set(CPACK_PACKAGE_VENDOR "The FxProbe authors")
set(CPACK_PACKAGE_CONTACT "The FxProbe authors <fxprobe@localhost>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "${PROJECT_DESCRIPTION}")
set(CPACK_PACKAGE_DIRECTORY "${PROJECT_BINARY_DIR}/packages")
set(CPACK_STRIP_FILES ON)
if(WIN32)
    set(CPACK_GENERATOR ZIP)
    set(CPACK_PACKAGE_FILE_NAME "fxprobe-${PROJECT_VERSION}-windows-x86_64")
else()
    set(CPACK_GENERATOR DEB)
    set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
    set(CPACK_DEBIAN_PACKAGE_SECTION sound)
    set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
    set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
        OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
endif()
include(CPack)
