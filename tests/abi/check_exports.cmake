# SPDX-License-Identifier: Apache-2.0
# Fails if LIBRARY exports a name that does not match the regular expression MEANT, or none, or if
# a text of the list NEEDED stands in no readable name, or one of the list HIDDEN does, or if a name
# of the list C_NAMES, which are meant besides, is not exported:
#   cmake -DNM=nm -DLIBRARY=<file> -DMEANT=<regex> [-DNEEDED=...] [-DNEEDED_BY=<script>] [-DHIDDEN=...]
#         [-DC_NAMES=...] -P check_exports.cmake
# The script sets more needed texts, as the list needed_entries.
# Names are compared as they stand in the symbol table: the readable name of a template function
# begins with its return type and would hide whose function it is.
cmake_minimum_required(VERSION 3.25)

execute_process(COMMAND "${NM}" -D --defined-only --format=posix "${LIBRARY}"
                OUTPUT_VARIABLE table COMMAND_ERROR_IS_FATAL ANY)
string(REGEX MATCHALL "[^\n]+" lines "${table}")
set(count 0)
set(stray "")
set(missing "${C_NAMES}")
foreach(line IN LISTS lines)
  string(REGEX REPLACE "[ @].*" "" name "${line}")
  if(name IN_LIST C_NAMES)
    list(REMOVE_ITEM missing "${name}")
    math(EXPR count "${count} + 1")
  elseif(name MATCHES "${MEANT}")
    math(EXPR count "${count} + 1")
  else()
    list(APPEND stray "${name}")
  endif()
endforeach()

if(stray)
  list(JOIN stray "\n  " text)
  message(FATAL_ERROR "${LIBRARY} exports names that are not its interface:\n  ${text}")
elseif(missing)
  list(JOIN missing "\n  " text)
  message(FATAL_ERROR "${LIBRARY} does not export\n  ${text}")
elseif(count EQUAL 0)
  message(FATAL_ERROR "${LIBRARY} exports nothing")
endif()
execute_process(COMMAND "${NM}" -D --defined-only -C "${LIBRARY}"
                OUTPUT_VARIABLE readable COMMAND_ERROR_IS_FATAL ANY)
if(NEEDED_BY)
  include("${NEEDED_BY}")
endif()
foreach(name IN LISTS NEEDED needed_entries)
  string(FIND "${readable}" "${name}" at)
  if(at EQUAL -1)
    message(FATAL_ERROR "${LIBRARY} does not export ${name}")
  endif()
endforeach()
foreach(name IN LISTS HIDDEN)
  string(FIND "${readable}" "${name}" at)
  if(NOT at EQUAL -1)
    message(FATAL_ERROR "${LIBRARY} exports ${name}, which is its own affair")
  endif()
endforeach()
message(STATUS "${count} exported names, all meant")
