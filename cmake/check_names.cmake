# SPDX-License-Identifier: Apache-2.0
# Proves that what pages name is there: tests and benchmarks, C names, methods, variables, and the
# commands of ./run.
#   cmake -DROOT=<tree> -P cmake/check_names.cmake
cmake_minimum_required(VERSION 3.25)
include("${CMAKE_CURRENT_LIST_DIR}/house_files.cmake")

# texts(OUT FILE...): the files behind each other.
function(texts out)
  set(all "")
  foreach(file IN LISTS ARGN)
    file(READ "${ROOT}/${file}" text)
    string(APPEND all "${text}\n")
  endforeach()
  set(${out} "${all}" PARENT_SCOPE)
endfunction()

house_files("${ROOT}" build_files CMakeLists.txt *.cmake)
texts(build_texts ${build_files})
# Some programs of the statistics library have the names of their files.
file(GLOB programs RELATIVE "${ROOT}/tests/statistics" "${ROOT}/tests/statistics/*/*.cpp")
list(TRANSFORM programs REPLACE ".*/([a-z]+)_(.*)\\.cpp" " \\1_statistics_\\2 ")
string(APPEND build_texts "${programs}")
texts(c_texts statistics/include/tarn_rvx.h offload/include/tarn_rvx_offload.h)
texts(rows rng/distributions/distributions.def)
house_files("${ROOT}" sources *.cpp *.hpp *.h *.c *.def *.cmake *.sh CMakeLists.txt)
list(FILTER sources EXCLUDE REGEX "^(tests|docs)/")
texts(source_texts ${sources} CMakeLists.txt run)
texts(run_texts run)
string(REGEX MATCH "\nusage: ./run COMMAND\n.*\nTEXT\n" run_texts "${run_texts}")
string(REGEX MATCHALL "\n  [a-z]+ " run_texts "${run_texts}")

file(GLOB_RECURSE pages RELATIVE "${ROOT}" "${ROOT}/docs/*.md" "${ROOT}/examples/*.md")
set(count 0)
set(wrong "")

# check(PAGE TEXT PATTERN WHAT PLACES): what matches has to stand in the variable PLACES, as a word.
macro(check page text pattern what places)
  string(REGEX MATCHALL "${pattern}" found "${text}")
  list(REMOVE_DUPLICATES found)
  foreach(name IN LISTS found)
    string(REGEX REPLACE "^(`|\\./run )|`$" "" name "${name}")
    math(EXPR count "${count} + 1")
    if(NOT "\n${${places}}\n" MATCHES "[^A-Za-z0-9_]${name}[^A-Za-z0-9_]")
      string(APPEND wrong "${page}: there is no ${what} ${name}\n")
    endif()
  endforeach()
endmacro()

foreach(page IN ITEMS README.md HACKING.md LISTS pages)
  file(READ "${ROOT}/${page}" text)
  check("${page}" "${text}" "`(kat|law|parity|refuse|unit|abi|consumer|house|fuzz|bench)_[a-z0-9_]+[a-z0-9]`"
        "test" build_texts)
  check("${page}" "${text}" "`(rvx[A-Za-z0-9]+|RVX_[A-Z0-9_]+[A-Z0-9])`" "C name" c_texts)
  check("${page}" "${text}" "[a-z_]+_method::[a-z0-9_]+" "method" rows)
  check("${page}" "${text}" "`(TARN|LUMEN)_[A-Z0-9_]+[A-Z0-9]`" "variable" source_texts)
  check("${page}" "${text}" "\\./run [a-z]+" "command" run_texts)
endforeach()

if(wrong)
  message(FATAL_ERROR "${wrong}")
elseif(count EQUAL 0)
  message(FATAL_ERROR "the pages name nothing: nothing was checked")
endif()
message(STATUS "${count} names on pages are there")
