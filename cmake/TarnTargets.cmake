# SPDX-License-Identifier: Apache-2.0
# What every target of the house shares: language level, warnings, visibility, sanitizers,
# and one line per test.

if(NOT CMAKE_BUILD_TYPE AND NOT CMAKE_CONFIGURATION_TYPES)
  set(CMAKE_BUILD_TYPE Release CACHE STRING "Build type" FORCE)
endif()
set(CMAKE_CXX_STANDARD 17)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_C_STANDARD 11)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_C_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)
set(CMAKE_RUNTIME_OUTPUT_DIRECTORY "${CMAKE_BINARY_DIR}/bin")
set(CMAKE_LIBRARY_OUTPUT_DIRECTORY "${CMAKE_BINARY_DIR}/lib")
set(CMAKE_INSTALL_RPATH "$ORIGIN")

# The number in the names of all libraries (soname). A program keeps to the one it was linked to: below
# 1.0 a new minor version may break it, from then on a new major version.
set(TARN_SOVERSION ${PROJECT_VERSION_MAJOR})
if(PROJECT_VERSION_MAJOR EQUAL 0)
  set(TARN_SOVERSION 0.${PROJECT_VERSION_MINOR})
endif()

# The one public header that is made: what the others belong to.
configure_file("${CMAKE_CURRENT_LIST_DIR}/tarn_version.h.in" "${PROJECT_BINARY_DIR}/include/tarn_version.h")

find_program(TARN_CCACHE ccache)
if(TARN_CCACHE AND NOT CMAKE_CXX_COMPILER_LAUNCHER)
  set(CMAKE_C_COMPILER_LAUNCHER "${TARN_CCACHE}")
  set(CMAKE_CXX_COMPILER_LAUNCHER "${TARN_CCACHE}")
endif()

# Contraction is a decision of the source, never of the compiler: one multiply-add gives the
# same bits on every device only if it is fused where, and only where, the code says so.
add_compile_options($<$<COMPILE_LANGUAGE:C,CXX>:-ffp-contract=off>)

if(TARN_SANITIZE)
  add_compile_options(-fsanitize=${TARN_SANITIZE} -fno-omit-frame-pointer -fno-sanitize-recover=all)
  add_link_options(-fsanitize=${TARN_SANITIZE})
endif()

# What every test finds in its environment. Native devices are for the tests that are about them.
set(TARN_TEST_ENV "LUMEN_BACKENDS=virtual\\;cuda")
if(TARN_SANITIZE MATCHES "thread")
  list(APPEND TARN_TEST_ENV "TSAN_OPTIONS=suppressions=${CMAKE_CURRENT_LIST_DIR}/thread_sanitizer.supp")
endif()

# Warnings for our own targets only, never for those who link us.
function(tarn_warnings target)
  set(ours -Wall -Wextra -Wpedantic -Wshadow -Wconversion)
  if(TARN_WERROR)
    list(APPEND ours -Werror)
  endif()
  target_compile_options(${target} PRIVATE $<$<COMPILE_LANGUAGE:C,CXX>:${ours}>
                                           $<$<COMPILE_LANGUAGE:CXX>:-Wnon-virtual-dtor>)
  # What nvcc makes of a source for the host compiler is not all ours.
  if(TARN_CUDA)
    target_compile_options(${target} PRIVATE $<$<COMPILE_LANGUAGE:CUDA>:-Xcompiler=-Wall,-Wextra>)
    if(TARN_WERROR)
      target_compile_options(${target} PRIVATE
        "$<$<COMPILE_LANGUAGE:CUDA>:SHELL:-Werror all-warnings -Xcompiler=-Werror>")
    endif()
  endif()
endfunction()

# tarn_kernel_sources(FILE...): sources that launch kernels, compiled as CUDA where that is asked
# for. To be called in the folder of their target.
function(tarn_kernel_sources)
  if(TARN_CUDA)
    set_source_files_properties(${ARGN} PROPERTIES LANGUAGE CUDA)
  endif()
endfunction()

# tarn_shared_library(TARGET OUTPUT_NAME EXPORT_NAME SOURCES...)
# A shared library with the house's visibility and versioning, and the alias tarn::EXPORT_NAME.
# A file exports.map in the target's folder is its linker version script: nothing else is shown.
function(tarn_shared_library target output export)
  add_library(${target} SHARED ${ARGN})
  add_library(tarn::${export} ALIAS ${target})
  set_target_properties(${target} PROPERTIES OUTPUT_NAME ${output} EXPORT_NAME ${export}
                        VERSION ${PROJECT_VERSION} SOVERSION ${TARN_SOVERSION})
  if(NOT TARN_SANITIZE)  # the sanitizers' own symbols come with the program
    target_link_options(${target} PRIVATE -Wl,--no-undefined -Wl,--as-needed)
  endif()
  set(map "${CMAKE_CURRENT_SOURCE_DIR}/exports.map")
  if(EXISTS "${map}")
    target_link_options(${target} PRIVATE "LINKER:--version-script=${map}")
    set_property(TARGET ${target} APPEND PROPERTY LINK_DEPENDS "${map}")
  endif()
  tarn_warnings(${target})
endfunction()

# tarn_test(NAME SOURCES file... [LIBS target...] [ENV NAME=VALUE...])
# One GoogleTest program. The prefix of the name (kat_, law_, parity_, refuse_, unit_, abi_,
# consumer_) says the kind of proof and becomes the CTest label. The cases of each program are
# written as XML to <build>/test-results, from which `./run test` counts passed, failed, skipped.
function(tarn_test name)
  cmake_parse_arguments(PARSE_ARGV 1 T "" "" "SOURCES;LIBS;ENV")
  add_executable(${name} ${T_SOURCES})
  tarn_warnings(${name})
  target_link_libraries(${name} PRIVATE ${T_LIBS} GTest::gtest GTest::gtest_main)
  add_test(NAME ${name} COMMAND ${name})
  string(REGEX MATCH "^[a-z]+" kind "${name}")
  set_tests_properties(${name} PROPERTIES LABELS "${kind}" TIMEOUT 600
    ENVIRONMENT "GTEST_OUTPUT=xml:${CMAKE_BINARY_DIR}/test-results/${name}.xml;${TARN_TEST_ENV};${T_ENV}")
endfunction()
