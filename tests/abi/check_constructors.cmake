# SPDX-License-Identifier: Apache-2.0
# Fails unless loading LIBRARY runs the static initialisers of the sources in the list EXPECTED, in
# that order, and nothing else of ours:
#   cmake -DNM=nm -DREADELF=readelf -DLIBRARY=<file> "-DEXPECTED=a.cpp;b.cpp" -P check_constructors.cmake
# What runs stands in the section .init_array, as addresses that the relocations tell and the symbol
# table names. The compiler calls the initialiser of a source without a global name by the source's.
cmake_minimum_required(VERSION 3.25)

foreach(what sections relocs)
  execute_process(COMMAND "${READELF}" "--${what}" --wide "${LIBRARY}"
                  OUTPUT_VARIABLE ${what} COMMAND_ERROR_IS_FATAL ANY)
endforeach()
execute_process(COMMAND "${NM}" --format=posix "${LIBRARY}"
                OUTPUT_VARIABLE symbols COMMAND_ERROR_IS_FATAL ANY)

foreach(other .preinit_array .ctors)
  if(sections MATCHES " \\${other} ")
    message(FATAL_ERROR "${LIBRARY} has a section ${other}, which is not looked into")
  endif()
endforeach()
if(NOT sections MATCHES " \\.init_array +INIT_ARRAY +([0-9a-f]+) [0-9a-f]+ ([0-9a-f]+)")
  message(FATAL_ERROR "${LIBRARY} has no section .init_array, which the C runtime needs")
endif()
math(EXPR place "0x${CMAKE_MATCH_1}")
math(EXPR end "${place} + 0x${CMAKE_MATCH_2}")

# row_with(ROW TEXT NEEDLE): the first line of TEXT that has NEEDLE, or nothing. Regular expressions
# are too slow for tables of this length.
function(row_with row text needle)
  set(${row} "" PARENT_SCOPE)
  string(FIND "${text}" "${needle}" at)
  if(at GREATER -1)
    string(SUBSTRING "${text}" 0 ${at} before)
    string(FIND "${before}" "\n" start REVERSE)
    math(EXPR start "${start} + 1")
    string(SUBSTRING "${text}" ${start} 4000 line)
    string(REGEX REPLACE "\n.*" "" line "${line}")
    set(${row} "${line}" PARENT_SCOPE)
  endif()
endfunction()

set(found "")
while(place LESS end)
  math(EXPR at "${place}" OUTPUT_FORMAT HEXADECIMAL)
  string(SUBSTRING "${at}" 2 -1 at)
  row_with(relocation "${relocs}" "${at}  ")
  if(NOT relocation MATCHES "^0*${at} .*RELATIVE +([0-9a-f]+)")
    message(FATAL_ERROR "${LIBRARY} has no relocation for the constructor at ${at}")
  endif()
  row_with(symbol "${symbols}" " t ${CMAKE_MATCH_1} ")
  string(REGEX REPLACE "^_GLOBAL__sub_I_| .*" "" name "${symbol}")
  if(NOT name STREQUAL "frame_dummy")  # of the C runtime
    list(APPEND found "'${name}'")
  endif()
  math(EXPR place "${place} + 8")
endwhile()

list(TRANSFORM EXPECTED REPLACE "(.+)" "'\\1'")
if(NOT found STREQUAL EXPECTED)
  message(FATAL_ERROR "the constructors of ${LIBRARY} are ${found} instead of ${EXPECTED}")
endif()
message(STATUS "the constructors are ${found}")
