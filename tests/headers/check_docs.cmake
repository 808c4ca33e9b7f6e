# SPDX-License-Identifier: Apache-2.0
# Fails unless Doxygen makes the reference of the headers below ROOT without a warning:
#   cmake -DROOT=<tree> -DDOXYFILE=<file> -DOUT=<folder> -P check_docs.cmake
# Without Doxygen it says so in a line that begins with "skipped: ".
cmake_minimum_required(VERSION 3.25)
find_program(doxygen doxygen)
if(NOT doxygen)
  message(STATUS "skipped: there is no doxygen to check the comments with")
  return()
endif()
file(REMOVE_RECURSE "${OUT}")
file(MAKE_DIRECTORY "${OUT}")
execute_process(COMMAND "${CMAKE_COMMAND}" -E env "TARN_DOCS=${OUT}" "${doxygen}" "${DOXYFILE}"
                WORKING_DIRECTORY "${ROOT}" RESULT_VARIABLE status ERROR_VARIABLE text)
if(NOT status EQUAL 0)
  message(FATAL_ERROR "something public is not documented, or not rightly:\n${text}")
endif()
# One page of each language that is there only if its headers were read.
foreach(page index.html namespacekestrel_1_1tarn_1_1rng.html tarn__rvx_8h.html tarn__rvx__offload_8h.html
        tarn__serv_8h.html)
  if(NOT EXISTS "${OUT}/html/${page}")
    message(FATAL_ERROR "the reference has no page ${page}")
  endif()
endforeach()
