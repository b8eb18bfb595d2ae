# Run by a test (cmake -P): fails for each source that includes a header of a room that does not lie below its own. The linker
# finds calls upwards, but not the use of a header that needs no library.
cmake_minimum_required(VERSION 3.22)

set(effects Main/AudioEngineController/Effects)
# From the bottom up. A room knows itself and the rows before its own, but not its neighbours.
set(rows
    "Core/BaseLib/Log"
    "Core/BaseLib/Files"
    "Core/BaseLib/Process"
    "Core/BaseLib/Binary"
    "Main/ReWire Main/VLib ${effects}/BusFormats ${effects}/Catalogue ${effects}/VST3/HostObjects"
    "${effects}/Plugin ${effects}/Protocol"
    "${effects}/Host ${effects}/VST/Interface"
    "${effects}/Launcher ${effects}/CLAP ${effects}/VST ${effects}/VST3"
    "${effects} Core/BaseLib/WorkstationServices"
    "Workstation/Options Workstation/Summary"
    "Workstation/Manage"
    "Workstation/Library Workstation/Output"
    "Scanner Workstation")
# What lies in the folder of one of these is known there only.
set(closed_rooms "${effects}/VST" "${effects}/VST3" Workstation)
set(height 0)
foreach(row IN LISTS rows)
    string(REPLACE " " ";" rooms "${row}")
    foreach(room IN LISTS rooms)
        set("height_of_${room}" ${height})
    endforeach()
    math(EXPR height "${height} + 1")
endforeach()

# room_of(FILE ROOM HEIGHT): the room of a file and its row; no row (-1) for a folder that the table does not have.
function(room_of file room height)
    get_filename_component(folder "${file}" DIRECTORY)
    string(REGEX REPLACE "/(posix|win32)$" "" folder "${folder}")
    set(${room} "${folder}" PARENT_SCOPE)
    set(${height} -1 PARENT_SCOPE)
    if(DEFINED "height_of_${folder}")
        set(${height} "${height_of_${folder}}" PARENT_SCOPE)
    endif()
endfunction()

# is_open(ROOM TO IS_OPEN): whether a room may be known to another, wherever that lies.
function(is_open room to is_open)
    get_filename_component(parent "${room}" DIRECTORY)
    string(FIND "${to}/" "${parent}/" place)
    set(${is_open} TRUE PARENT_SCOPE)
    if(parent IN_LIST closed_rooms AND NOT place EQUAL 0)
        set(${is_open} FALSE PARENT_SCOPE)
    endif()
endfunction()

get_filename_component(root "${CMAKE_CURRENT_LIST_DIR}" DIRECTORY)
foreach(folder Core Main Scanner Workstation)
    file(GLOB_RECURSE sources RELATIVE "${root}" "${root}/${folder}/*.h" "${root}/${folder}/*.cpp")
    foreach(source IN LISTS sources)
        room_of("${source}" own own_height)
        file(STRINGS "${root}/${source}" includes REGEX "^ *# *include \"")
        foreach(include IN LISTS includes)
            string(REGEX REPLACE "^[^\"]*\"([^\"]*)\".*" "\\1" header "${include}")
            room_of("${header}" other other_height)
            if(NOT own STREQUAL other AND (other_height LESS 0 OR NOT other_height LESS own_height))
                message(SEND_ERROR "${source} includes ${header}, which does not lie below it")
            endif()
            is_open("${other}" "${own}" other_is_open)
            if(NOT other_is_open)
                message(SEND_ERROR "${source} includes ${header}, which is for the folder around it only")
            endif()
        endforeach()
    endforeach()
endforeach()
