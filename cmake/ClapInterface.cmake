# The CLAP interface: plain headers, as the package dpf-source ships them.
set(CLAP_ROOT "/usr/share/dpf/distrho/src" CACHE PATH "Folder that holds the CLAP headers in its folder clap")
if(NOT EXISTS "${CLAP_ROOT}/clap/entry.h")
    message(FATAL_ERROR "No CLAP headers in '${CLAP_ROOT}/clap': install the packages that scripts/setup lists, "
                        "or name another copy with -DCLAP_ROOT=")
endif()

# In a folder of its own: beside the headers lie others, under names that are common.
set(clap_copy "${PROJECT_BINARY_DIR}/clap-headers")
file(COPY "${CLAP_ROOT}/clap" DESTINATION "${clap_copy}")
add_library(clapinterface INTERFACE)
target_include_directories(clapinterface SYSTEM INTERFACE "${clap_copy}")
