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

# Qt's words "signals" and "slots" are names like any other in our code.
add_compile_definitions(QT_NO_KEYWORDS)

find_program(CCACHE_PROGRAM ccache)
find_program(ENV_PROGRAM env)
if(CCACHE_PROGRAM AND ENV_PROGRAM)
    # Clones share what was compiled, wherever they lie. Without the sloppiness ccache stores nothing that is compiled with a
    # precompiled header; it still compares what the headers hold.
    set(compiler_cache "${ENV_PROGRAM}" "CCACHE_BASEDIR=${PROJECT_SOURCE_DIR}" CCACHE_NOHASHDIR=1
        "CCACHE_SLOPPINESS=pch_defines,time_macros,include_file_mtime,include_file_ctime" "${CCACHE_PROGRAM}")
    set(CMAKE_C_COMPILER_LAUNCHER ${compiler_cache})
    set(CMAKE_CXX_COMPILER_LAUNCHER ${compiler_cache})
endif()

# What the build generates, Qt's meta objects, is not ours to mend: one check that never finds anything in it takes the place of
# ours, since clang-tidy refuses to run without any.
file(WRITE "${PROJECT_BINARY_DIR}/.clang-tidy" "Checks: '-*,misc-unused-alias-decls'\nInheritParentConfig: false\n")

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
    target_include_directories(${target} PUBLIC "$<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}>")
    if(FXPROBE_SANITIZE)
        target_compile_options(${target} PRIVATE -fsanitize=${FXPROBE_SANITIZE}
                               -fno-sanitize-recover=all -fno-omit-frame-pointer)
        target_link_options(${target} PUBLIC -fsanitize=${FXPROBE_SANITIZE})
    endif()
endfunction()

# Only g++'s are shared by clones through the compiler cache without more ado.
set(FXPROBE_PRECOMPILE OFF)
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU" AND NOT CMAKE_DISABLE_PRECOMPILE_HEADERS)
    set(FXPROBE_PRECOMPILE ON)
endif()

# fxprobe_precompile(OWNER LINK libraries… HEADERS headers…): compiles the headers once, as the libraries' users see them. The
# owner is a target of its own, since what shares them must have all of its definitions.
function(fxprobe_precompile owner)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "LINK;HEADERS")
    set(empty_source "${CMAKE_CURRENT_BINARY_DIR}/${owner}.cpp")
    file(GENERATE OUTPUT "${empty_source}" CONTENT "")
    add_library(${owner} OBJECT "${empty_source}")
    target_link_libraries(${owner} PRIVATE ${arg_LINK})
    fxprobe_target(${owner})
    if(FXPROBE_PRECOMPILE)
        target_precompile_headers(${owner} PRIVATE ${arg_HEADERS})
    endif()
endfunction()

# fxprobe_share_precompiled(OWNER TARGETS…): the targets must be compiled with the owner's options.
function(fxprobe_share_precompiled owner)
    if(FXPROBE_PRECOMPILE)
        foreach(target IN LISTS ARGN)
            target_precompile_headers(${target} REUSE_FROM ${owner})
            # ccache needs it to see which precompiled header a source takes.
            target_compile_options(${target} PRIVATE -fpch-preprocess)
        endforeach()
    endif()
endfunction()
