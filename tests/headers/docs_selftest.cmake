# SPDX-License-Identifier: Apache-2.0
# The check of the comments passes a copy of the documented tree, and finds what is spoiled in it:
#   cmake -DCHECK=<check_docs.cmake> -DROOT=<tree> -DFIXTURE=<folder> -P docs_selftest.cmake
cmake_minimum_required(VERSION 3.25)
find_program(doxygen doxygen)
if(NOT doxygen)
  message(STATUS "skipped: there is no doxygen to check the comments with")
  return()
endif()

# check(RESULT TEXT): what the check says of the fixture.
function(check result text)
  execute_process(COMMAND "${CMAKE_COMMAND}" "-DROOT=${FIXTURE}" "-DDOXYFILE=${FIXTURE}/docs/Doxyfile"
                          "-DOUT=${FIXTURE}/out" -P "${CHECK}"
                  RESULT_VARIABLE status OUTPUT_QUIET ERROR_VARIABLE said)
  # CMake breaks lines of its messages, where depends on the length of the folder's name.
  string(REGEX REPLACE "[ \n]+" " " said "${said}")
  set(${result} "${status}" PARENT_SCOPE)
  set(${text} "${said}" PARENT_SCOPE)
endfunction()

# expect_found(FILE TEXT NEEDLE): with TEXT behind FILE the check fails and names NEEDLE.
function(expect_found file text needle)
  file(READ "${FIXTURE}/${file}" whole)
  file(APPEND "${FIXTURE}/${file}" "${text}")
  check(status said)
  file(WRITE "${FIXTURE}/${file}" "${whole}")
  string(FIND "${said}" "${needle}" at)
  if(status EQUAL 0 OR at EQUAL -1)
    message(FATAL_ERROR "not found in ${file}: ${needle}\n${said}")
  endif()
endfunction()

file(REMOVE_RECURSE "${FIXTURE}")
foreach(part docs rng/include service/include statistics/include core/include offload/include)
  file(COPY "${ROOT}/${part}/" DESTINATION "${FIXTURE}/${part}")
endforeach()
check(status said)
if(NOT status EQUAL 0)
  message(FATAL_ERROR "the tree itself is refused:\n${said}")
endif()

set(cxx rng/include/kestrel/tarn/rng/generate.hpp)
expect_found(${cxx} "namespace kestrel::tarn::rng { void bare(); }\n" "bare()")
expect_found(${cxx} "namespace kestrel::tarn::rng {\n/// Says much.\nclass partly {\n public:\n  int bare_member() const;\n};\n}\n"
             "bare_member()")
expect_found(${cxx} "namespace kestrel::tarn::rng {\n/// Takes.\n/// \\param b  there is none\nvoid wrong(int a);\n}\n"
             "'b' of command")
expect_found(statistics/include/tarn_rvx.h "RVX_API int rvxBare(void)\;\n" "rvxBare")
expect_found(core/include/tarn_serv.h "TARN_SERV_API int tarn_serv_bare(void)\;\n" "tarn_serv_bare")
expect_found(offload/include/tarn_rvx_offload.h "TARN_RVX_OFFLOAD_API int tarn_rvx_bare(void)\;\n" "tarn_rvx_bare")
