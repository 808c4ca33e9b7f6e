# SPDX-License-Identifier: Apache-2.0
# Compiles the sources of the device road with Clang, without a warning; the build does it with g++.
#   cmake -DROOT=<tree> -DBINARY=<build folder> -Dcompiler=<clang++> -P <this>
cmake_minimum_required(VERSION 3.25)
if(NOT compiler)
  message(STATUS "skipped: no clang++ (Debian package clang)")
  return()
endif()
file(GLOB sources "${ROOT}/rng/engines/*_gpu.cpp")
list(LENGTH sources count)
if(count EQUAL 0)
  message(FATAL_ERROR "no sources of a device road below ${ROOT}/rng")
endif()
set(failures 0)
foreach(source IN LISTS sources)
  execute_process(
    COMMAND "${compiler}" -std=c++17 -fsyntax-only -Wall -Wextra -Wpedantic -Wshadow -Wconversion
            -Werror "-I${ROOT}" "-I${ROOT}/rng" "-I${ROOT}/rng/include" "-I${ROOT}/lumen/include"
            "-I${ROOT}/statistics/include" "-I${ROOT}/core/include" "${source}"
    RESULT_VARIABLE status ERROR_VARIABLE text)
  if(NOT status EQUAL 0)
    math(EXPR failures "${failures} + 1")
    message(STATUS "${source}:\n${text}")
  endif()
endforeach()
if(failures)
  message(FATAL_ERROR "${failures} of ${count} sources do not compile with ${compiler}")
endif()
message(STATUS "${count} sources compile with ${compiler}")
