# Installs the library, moves it, builds the example with it, and has that scan scripted plug-ins (cmake -P).
cmake_minimum_required(VERSION 3.22)
set(folder "${BUILD_FOLDER}/installed")
file(REMOVE_RECURSE "${folder}")

# run(WHAT COMMAND…): its output in `output`; all of it is shown when it fails.
function(run what)
    execute_process(COMMAND ${ARGN} OUTPUT_VARIABLE out ERROR_VARIABLE err RESULT_VARIABLE result)
    if(NOT result STREQUAL "0")
        message(FATAL_ERROR "${what} failed (${result}):\n${out}${err}")
    endif()
    set(output "${out}" PARENT_SCOPE)
    set(errors "${err}" PARENT_SCOPE)
endfunction()

foreach(component programs dev)
    run("The installation of ${component}" "${CMAKE_COMMAND}" --install "${BUILD_FOLDER}" --component ${component}
        --prefix "${folder}/first")
endforeach()
file(RENAME "${folder}/first" "${folder}/prefix")

# What names a place of this machine works nowhere else.
file(GLOB_RECURSE installed "${folder}/prefix/*.cmake" "${folder}/prefix/*.h" "${folder}/prefix/*.a")
foreach(file IN LISTS installed)
    file(STRINGS "${file}" lines)
    string(FIND "${lines}" "${SOURCE_FOLDER}" place)
    if(NOT place EQUAL -1)
        message(SEND_ERROR "${file} names ${SOURCE_FOLDER}")
    endif()
endforeach()

set(options -G "${GENERATOR}" -DCMAKE_BUILD_TYPE=Release "-DCMAKE_PREFIX_PATH=${folder}/prefix")
if(TOOLCHAIN)
    # The toolchain looks for packages below its own folders only.
    file(GLOB package "${folder}/prefix/*/cmake/FxProbe")
    list(APPEND options "-DCMAKE_TOOLCHAIN_FILE=${TOOLCHAIN}" "-DFXPROBE_WINDOWS_PREFIX=${WINDOWS_PREFIX}"
         "-DFxProbe_DIR=${package}")
endif()
run("Configuring the example" "${CMAKE_COMMAND}" -S "${SOURCE_FOLDER}/examples/scan" -B "${folder}/example" ${options})
run("Building the example" "${CMAKE_COMMAND}" --build "${folder}/example")

# put(FILE MODULE SCRIPT): a plug-in that does what the script says.
function(put file module script)
    file(COPY_FILE "${module}" "${folder}/plugins/${file}")
    file(WRITE "${folder}/plugins/${file}.script" "${script}")
endfunction()
file(MAKE_DIRECTORY "${folder}/plugins")
get_filename_component(ending "${VST2}" EXT)
put("Good${ending}" "${VST2}" "vendor Makers\n")
put("Killer${ending}" "${VST2}" "fault static-constructor abort\n")
put(Two.vst3 "${VST3}" "class Two\n")
file(GLOB program "${folder}/example/scan" "${folder}/example/scan.exe")
# The second time, nothing has changed and nothing is loaded.
foreach(probes 3 0)
    run("The example" ${EMULATOR} "${program}" "${DRIVE}${folder}/data" "${DRIVE}${folder}/plugins" "${DRIVE}${folder}/away")
    string(REPLACE "\r" "" output "${output}")
    if(NOT output MATCHES "^Good \\(vst2\\): ok\nKiller \\(vst2\\): it [^\n]*\nTwo \\(vst3\\): ok\n$")
        message(SEND_ERROR "The example printed:\n${output}${errors}")
    endif()
    # The last of it; before that it depends on how long things take.
    string(REGEX MATCH "3 of 3: (Good|Killer|Two)\\." shown "${errors}")
    if((probes EQUAL 0 AND errors) OR (probes GREATER 0 AND NOT shown))
        message(SEND_ERROR "The example showed this progress: ${errors}")
    endif()
endforeach()
