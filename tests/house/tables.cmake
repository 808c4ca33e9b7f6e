# SPDX-License-Identifier: Apache-2.0
# Sees that the tables of the pages are what their maker makes of the present rows.
#   cmake -DROOT=<tree> -DSCRATCH=<folder> -P tables.cmake
cmake_minimum_required(VERSION 3.25)
file(REMOVE_RECURSE "${SCRATCH}")
execute_process(COMMAND ${CMAKE_COMMAND} -DROOT=${ROOT} -DOUT=${SCRATCH}
                        -P "${ROOT}/tools/tables/tables.cmake"
                RESULT_VARIABLE status ERROR_VARIABLE said OUTPUT_QUIET)
if(status)
  message(FATAL_ERROR "the tables cannot be made: ${said}")
endif()
file(GLOB_RECURSE pages RELATIVE "${SCRATCH}" "${SCRATCH}/*.md")
list(LENGTH pages count)
if(count EQUAL 0)
  message(FATAL_ERROR "no page has a table: nothing was checked")
endif()
foreach(page IN LISTS pages)
  file(READ "${SCRATCH}/${page}" made)
  file(READ "${ROOT}/${page}" kept)
  if(NOT made STREQUAL kept)
    message(SEND_ERROR "${page}: a table is not that of the rows: ./run tables makes it anew")
  endif()
endforeach()
message(STATUS "${count} pages")
