# Builds for 64-bit Windows on Debian: MinGW-w64 with C++11 threads, the libraries that scripts/windows-toolchain made, and
# Wine for the programs that the build itself runs.
set(CMAKE_SYSTEM_NAME Windows)
set(CMAKE_SYSTEM_PROCESSOR x86_64)

set(windows_target x86_64-w64-mingw32)
set(CMAKE_C_COMPILER ${windows_target}-gcc-posix)
set(CMAKE_CXX_COMPILER ${windows_target}-g++-posix)
set(CMAKE_RC_COMPILER ${windows_target}-windres)
set(CMAKE_OBJDUMP ${windows_target}-objdump)

if(NOT FXPROBE_WINDOWS_PREFIX)
    execute_process(COMMAND "${CMAKE_CURRENT_LIST_DIR}/../scripts/windows-toolchain" --prefix
                    OUTPUT_VARIABLE FXPROBE_WINDOWS_PREFIX OUTPUT_STRIP_TRAILING_WHITESPACE
                    COMMAND_ERROR_IS_FATAL ANY)
    set(FXPROBE_WINDOWS_PREFIX "${FXPROBE_WINDOWS_PREFIX}" CACHE PATH "Qt, pugixml and GoogleTest for Windows")
endif()
if(NOT IS_DIRECTORY "${FXPROBE_WINDOWS_PREFIX}")
    message(FATAL_ERROR "Nothing in '${FXPROBE_WINDOWS_PREFIX}': run scripts/windows-toolchain first")
endif()
list(APPEND CMAKE_TRY_COMPILE_PLATFORM_VARIABLES FXPROBE_WINDOWS_PREFIX)

# Headers that are the same everywhere come from the machine itself: the VST 2 interface.
set(CMAKE_FIND_ROOT_PATH "${FXPROBE_WINDOWS_PREFIX}" /usr/${windows_target})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)

set(CMAKE_CROSSCOMPILING_EMULATOR "${CMAKE_CURRENT_LIST_DIR}/../scripts/wine-run")

# The programs need no library but those that Windows has.
set(CMAKE_EXE_LINKER_FLAGS_INIT -static)
set(CMAKE_MODULE_LINKER_FLAGS_INIT -static)
