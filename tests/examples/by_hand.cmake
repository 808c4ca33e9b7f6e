# SPDX-License-Identifier: Apache-2.0
# Builds examples by the command that stands after "Build: " in their comments, as a user does beside an
# installed copy, and runs them.
#   cmake -DHOUSE=<build folder> -DEXAMPLES=<folder> -DSCRATCH=<folder> -DFILES=<names> -DMORE=<names>
#         -P by_hand.cmake
# MORE are built, too, when TARN_LONG_TESTS is set.
cmake_minimum_required(VERSION 3.25)

# run(WHAT COMMAND...): fails with the command's text.
function(run what)
  execute_process(COMMAND ${ARGN} WORKING_DIRECTORY "${SCRATCH}" RESULT_VARIABLE result
                  OUTPUT_VARIABLE said ERROR_VARIABLE said)
  if(NOT result EQUAL 0)
    message(FATAL_ERROR "${what} ended with ${result}:\n${said}")
  endif()
endfunction()

file(REMOVE_RECURSE "${SCRATCH}")
file(MAKE_DIRECTORY "${SCRATCH}")
run("the installation" "${CMAKE_COMMAND}" --install "${HOUSE}" --prefix "${SCRATCH}/installed")
file(GLOB_RECURSE modules "${SCRATCH}/installed/tarn_rng.pc")
get_filename_component(modules "${modules}" DIRECTORY)
get_filename_component(libraries "${modules}" DIRECTORY)
set(ENV{PKG_CONFIG_PATH} "${modules}")
set(ENV{LD_LIBRARY_PATH} "${libraries}")

if("$ENV{TARN_LONG_TESTS}")
  list(APPEND FILES ${MORE})
endif()
set(count 0)
foreach(file IN LISTS FILES)
  configure_file("${EXAMPLES}/${file}" "${SCRATCH}/${file}" COPYONLY)
  file(READ "${SCRATCH}/${file}" text)
  # To the end of the line, or of the lines that are indented below it.
  if(NOT text MATCHES "\n(//|!| \\*) Build: ([^\n]*)((\n(//|!| \\*)   +[^\n]*)*)")
    message(FATAL_ERROR "${file} does not tell how it is built")
  endif()
  string(REGEX REPLACE "\n(//|!| \\*)" " " command "${CMAKE_MATCH_2}${CMAKE_MATCH_3}")
  if(NOT command MATCHES " -o ([a-z_]+)$")
    message(FATAL_ERROR "${file}: the command names no program: ${command}")
  endif()
  set(arguments "")
  if(file STREQUAL "random_walk.cpp")
    set(arguments 1000)
  endif()
  set(program "${CMAKE_MATCH_1}")
  run("${command}" sh -c "${command}")
  run("${program}" "${SCRATCH}/${program}" ${arguments})
  math(EXPR count "${count} + 1")
endforeach()
if(count EQUAL 0)
  message(FATAL_ERROR "nothing was built")
endif()
message(STATUS "${count} examples built by hand")
