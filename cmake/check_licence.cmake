# SPDX-License-Identifier: Apache-2.0
# Proves that every source and script names its licence in one of its first three lines:
#   cmake -DROOT=<tree> -P cmake/check_licence.cmake
cmake_minimum_required(VERSION 3.25)
include("${CMAKE_CURRENT_LIST_DIR}/house_files.cmake")

house_files("${ROOT}" files ${HOUSE_CODE} *.f90 *.cmake *.in *.map *.awk *.py *.sh CMakeLists.txt)
foreach(file run .ci/run packages.txt CMakeLists.txt)
  if(EXISTS "${ROOT}/${file}")
    list(APPEND files "${file}")
  endif()
endforeach()

set(count 0)
set(wrong "")
foreach(file IN LISTS files)
  math(EXPR count "${count} + 1")
  file(STRINGS "${ROOT}/${file}" lines LIMIT_COUNT 3)
  if(NOT lines MATCHES "SPDX-License-Identifier: Apache-2\\.0")
    string(APPEND wrong "${file}: no SPDX line at the top\n")
  endif()
endforeach()

if(wrong)
  message(FATAL_ERROR "${wrong}")
elseif(count EQUAL 0)
  message(FATAL_ERROR "no file found below ${ROOT}: nothing was checked")
endif()
message(STATUS "${count} files name their licence")
