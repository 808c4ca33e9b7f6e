# SPDX-License-Identifier: Apache-2.0
# Compiles every header below the folders of the list `include` alone as C++17.
cmake_minimum_required(VERSION 3.25)
set(headers "")
set(search "")
foreach(folder IN LISTS include)
  file(GLOB_RECURSE found RELATIVE "${folder}" "${folder}/*.hpp")
  if(NOT found)
    message(FATAL_ERROR "no headers below ${folder}")
  endif()
  list(APPEND headers ${found})
  list(APPEND search "-I${folder}")
endforeach()
list(LENGTH headers count)
set(failures 0)
foreach(header IN LISTS headers)
  execute_process(
    COMMAND "${compiler}" -std=c++17 -fsyntax-only -Wall -Wextra -Wpedantic -Wshadow -Wconversion
            -Werror ${search} "-I${sycl}" -include "${header}" -x c++ /dev/null
    RESULT_VARIABLE status ERROR_VARIABLE text)
  if(NOT status EQUAL 0)
    math(EXPR failures "${failures} + 1")
    message(STATUS "${header} does not compile alone:\n${text}")
  endif()
endforeach()
if(failures)
  message(FATAL_ERROR "${failures} of ${count} public headers do not compile alone")
endif()
message(STATUS "${count} public headers compile alone")
