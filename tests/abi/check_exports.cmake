# SPDX-License-Identifier: Apache-2.0
# Fails if LIBRARY exports a name that does not match the regular expression MEANT, or none:
#   cmake -DNM=nm -DLIBRARY=<file> -DMEANT=<regex> -P check_exports.cmake
# Names are compared as they stand in the symbol table: the readable name of a template function
# begins with its return type and would hide whose function it is.
cmake_minimum_required(VERSION 3.25)

execute_process(COMMAND "${NM}" -D --defined-only --format=posix "${LIBRARY}"
                OUTPUT_VARIABLE table COMMAND_ERROR_IS_FATAL ANY)
string(REGEX MATCHALL "[^\n]+" lines "${table}")
set(count 0)
set(stray "")
foreach(line IN LISTS lines)
  string(REGEX REPLACE "[ @].*" "" name "${line}")
  if(name MATCHES "${MEANT}")
    math(EXPR count "${count} + 1")
  else()
    list(APPEND stray "${name}")
  endif()
endforeach()

if(stray)
  list(JOIN stray "\n  " text)
  message(FATAL_ERROR "${LIBRARY} exports names that are not its interface:\n  ${text}")
elseif(count EQUAL 0)
  message(FATAL_ERROR "${LIBRARY} exports nothing")
endif()
message(STATUS "${count} exported names, all meant")
