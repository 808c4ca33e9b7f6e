# SPDX-License-Identifier: Apache-2.0
# Fails if LIBRARY asks the dynamic loader for a library whose name begins with one of the list
# ABSENT, or for none at all:
#   cmake -DREADELF=readelf -DLIBRARY=<file> -DABSENT=<name;...> -P check_needed.cmake
cmake_minimum_required(VERSION 3.25)

execute_process(COMMAND "${READELF}" -d "${LIBRARY}" OUTPUT_VARIABLE dynamic
                COMMAND_ERROR_IS_FATAL ANY)
string(REPLACE "[" "<" dynamic "${dynamic}")  # an open bracket would join elements of a list
string(REGEX MATCHALL "\\(NEEDED\\)[^\n]*<[A-Za-z0-9_.+-]+" entries "${dynamic}")
if(NOT entries)
  message(FATAL_ERROR "${LIBRARY} needs no library at all")
endif()
foreach(entry IN LISTS entries)
  string(REGEX REPLACE ".*<" "" needed "${entry}")
  foreach(name IN LISTS ABSENT)
    string(FIND "${needed}" "${name}" at)
    if(at EQUAL 0)
      message(FATAL_ERROR "${LIBRARY} is linked to ${needed}")
    endif()
  endforeach()
endforeach()
list(LENGTH entries count)
message(STATUS "${LIBRARY} needs ${count} libraries, none of them ${ABSENT}")
