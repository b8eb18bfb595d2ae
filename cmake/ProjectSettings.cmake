# Settings that hold for our own code; the libraries below third-party targets keep their own.
set(CMAKE_CXX_STANDARD 17)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_C_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)
set(CMAKE_RUNTIME_OUTPUT_DIRECTORY "${CMAKE_BINARY_DIR}/bin")
if(NOT CMAKE_BUILD_TYPE)
    set(CMAKE_BUILD_TYPE Release CACHE STRING "Kind of build" FORCE)
endif()

find_program(CCACHE_PROGRAM ccache)
if(CCACHE_PROGRAM)
    set(CMAKE_C_COMPILER_LAUNCHER "${CCACHE_PROGRAM}")
    set(CMAKE_CXX_COMPILER_LAUNCHER "${CCACHE_PROGRAM}")
endif()

# The folder that holds this platform's half of every room: posix or win32.
set(FXPROBE_PLATFORM posix)
if(WIN32)
    set(FXPROBE_PLATFORM win32)
endif()

# Applies warnings, sanitizers and the include root to one of our targets.
function(fxprobe_target target)
    target_compile_options(${target} PRIVATE -Wall -Wextra -Wconversion -Wshadow -Werror)
    if(CMAKE_CXX_COMPILER_ID STREQUAL "Clang")
        # Members that only one platform's half of a class uses; and signs, which g++'s -Wconversion leaves alone.
        target_compile_options(${target} PRIVATE -Wno-unused-private-field -Wno-sign-conversion)
    endif()
    # Messages name sources by their place in the tree, not by their place on the machine that built them.
    # The compiler cache hands paths over as seen from the build folder.
    file(RELATIVE_PATH source_from_build "${PROJECT_BINARY_DIR}" "${PROJECT_SOURCE_DIR}/")
    target_compile_options(${target} PRIVATE "-fmacro-prefix-map=${PROJECT_SOURCE_DIR}/="
                           "-fmacro-prefix-map=${source_from_build}=")
    target_include_directories(${target} PUBLIC "${PROJECT_SOURCE_DIR}")
    if(FXPROBE_SANITIZE)
        target_compile_options(${target} PRIVATE -fsanitize=${FXPROBE_SANITIZE}
                               -fno-sanitize-recover=all -fno-omit-frame-pointer)
        target_link_options(${target} PUBLIC -fsanitize=${FXPROBE_SANITIZE})
    endif()
endfunction()
