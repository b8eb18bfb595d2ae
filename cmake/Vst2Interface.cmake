# The VST 2.4 binary interface, as the package fst-dev describes it.
find_path(FST_INCLUDE_DIR pluginterfaces/fst/fst.h REQUIRED)
add_library(vst2interface INTERFACE)
target_include_directories(vst2interface SYSTEM INTERFACE "${FST_INCLUDE_DIR}")
# The header's notes to its own authors come as warnings, which not even a system header keeps to itself.
target_compile_options(vst2interface INTERFACE -Wno-cpp)
