# The VST 2.4 binary interface, as the package fst-dev describes it.
find_path(FST_INCLUDE_DIR pluginterfaces/fst/fst.h REQUIRED NO_CMAKE_FIND_ROOT_PATH)
# In a folder of its own: the folder that it is found in also holds the headers of this machine's system, which is not
# always the one that is built for.
set(fst_copy "${PROJECT_BINARY_DIR}/fst")
file(COPY "${FST_INCLUDE_DIR}/pluginterfaces/fst" DESTINATION "${fst_copy}/pluginterfaces")
add_library(vst2interface INTERFACE)
target_include_directories(vst2interface SYSTEM INTERFACE "${fst_copy}")
# The header's notes to its own authors come as warnings, which not even a system header keeps to itself.
target_compile_options(vst2interface INTERFACE -Wno-cpp)
