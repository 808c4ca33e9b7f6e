# SPDX-License-Identifier: Apache-2.0
# Proves that rng/ can be given to another SYCL: it names nothing of namespace sycl beyond the list
# in sycl_names.txt, no extension, no implementation, and does not ask which compiler it has.
#   cmake -DROOT=<tree> -P cmake/check_device_sources.cmake
cmake_minimum_required(VERSION 3.25)
include("${CMAKE_CURRENT_LIST_DIR}/house_files.cmake")

file(STRINGS "${CMAKE_CURRENT_LIST_DIR}/sycl_names.txt" allowed REGEX "^[a-z]")
set(foreign "[^a-z_]ext_[a-z]|sycl::ext|lumen|AdaptiveCpp|hipsycl|__CUDA|__SYCL|__GNUC__|__clang__")
set(failures 0)
set(names 0)

# blame(FILE WHAT): one breach.
macro(blame file what)
  math(EXPR failures "${failures} + 1")
  message(STATUS "${file}: ${what}")
endmacro()

house_files("${ROOT}" files ${HOUSE_CODE})
list(FILTER files INCLUDE REGEX "^rng/")
list(REMOVE_ITEM files rng/include/kestrel/tarn/export.hpp)  # how this compiler exports a name
foreach(file IN LISTS files)
  file(READ "${ROOT}/${file}" text)
  string(REGEX REPLACE "//[^\n]*" "" text "${text}")
  string(REGEX MATCHALL "sycl::[A-Za-z_0-9:]*[A-Za-z_0-9]" used "${text}")
  list(REMOVE_DUPLICATES used)
  foreach(name IN LISTS used)
    math(EXPR names "${names} + 1")
    string(REGEX REPLACE "^sycl::" "" name "${name}")
    if(NOT name IN_LIST allowed)
      blame("${file}" "sycl::${name} is not in sycl_names.txt")
    endif()
  endforeach()
  string(REGEX MATCHALL "${foreign}" found "${text}")
  list(REMOVE_DUPLICATES found)
  foreach(name IN LISTS found)
    blame("${file}" "${name} ties it to an implementation")
  endforeach()
  if(text MATCHES "using namespace sycl")
    blame("${file}" "using namespace sycl hides what is used")
  endif()
endforeach()
if(names EQUAL 0)
  message(FATAL_ERROR "no name of SYCL found below ${ROOT}/rng")
endif()
if(failures)
  message(FATAL_ERROR "${failures} breaches in rng/")
endif()
message(STATUS "rng/ keeps to the listed names of SYCL")
