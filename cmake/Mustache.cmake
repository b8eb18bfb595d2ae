# The templates of the HTML output: a header alone, of the package libkainjow-mustache-dev.
find_path(MUSTACHE_INCLUDE_DIR kainjow/mustache.hpp REQUIRED NO_CMAKE_FIND_ROOT_PATH)
# In a folder of its own: the folder that it is found in also holds the headers of this machine's system, which is not
# always the one that is built for.
set(mustache_copy "${PROJECT_BINARY_DIR}/mustache")
file(COPY "${MUSTACHE_INCLUDE_DIR}/kainjow" DESTINATION "${mustache_copy}")
add_library(mustache INTERFACE)
target_include_directories(mustache SYSTEM INTERFACE "${mustache_copy}")
