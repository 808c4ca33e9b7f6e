# SPDX-License-Identifier: Apache-2.0
# Compiles one fuzz target with Clang and runs it for a minute, from the seeds of its kind:
#   cmake -DROOT=<tree> -DSCRATCH=<folder> -DTARGET=<name> -DSEEDS=<fuzz_seeds> -Dcompiler=<clang++>
#         [-DLIMIT=<libFuzzer's options>] -P fuzz.cmake
# With TARN_LONG_TESTS=1 only (./run test --long). An input that fails stays in <folder>/<name>.
cmake_minimum_required(VERSION 3.25)
if(NOT "$ENV{TARN_LONG_TESTS}" STREQUAL "1")
  message(STATUS "skipped: fuzzing is for long runs (./run test --long)")
  return()
elseif(NOT compiler)
  message(STATUS "skipped: no clang++ (Debian package clang)")
  return()
endif()
if(NOT LIMIT)
  set(LIMIT -max_total_time=60)
endif()

set(folder "${SCRATCH}/${TARGET}")
set(program "${folder}/fuzz_${TARGET}")
file(REMOVE_RECURSE "${folder}")
file(MAKE_DIRECTORY "${folder}/seeds" "${folder}/corpus")
set(options -std=c++17 -g -O2 -fsanitize=fuzzer,address,undefined -fno-sanitize-recover=all
            -fno-omit-frame-pointer)

file(WRITE "${folder}/empty.cpp"
     "extern \"C\" int LLVMFuzzerTestOneInput(const unsigned char*, unsigned long) { return 0; }\n")
execute_process(COMMAND "${compiler}" ${options} -o "${folder}/empty" "${folder}/empty.cpp"
                RESULT_VARIABLE status OUTPUT_QUIET ERROR_QUIET)
if(NOT status EQUAL 0)
  message(STATUS "skipped: ${compiler} cannot link its fuzzer (Debian package libclang-rt-dev)")
  return()
endif()

set(sources tests/forge/fuzz_${TARGET}.cpp tests/forge/binaries.cpp core/src/memory.cpp)
foreach(unit binary_hash elf_view elf_writer exceptions hw_codes kernel_splice older_binary
        parse_binary replace_kernel splice_kernel)
  list(APPEND sources forge/${unit}.cpp)
endforeach()
list(TRANSFORM sources PREPEND "${ROOT}/")
execute_process(
  COMMAND "${compiler}" ${options} "-I${ROOT}/forge" "-I${ROOT}/core/include"
          -o "${program}" ${sources}
  RESULT_VARIABLE status ERROR_VARIABLE text)
if(NOT status EQUAL 0)
  message(FATAL_ERROR "fuzz_${TARGET} does not compile:\n${text}")
endif()
execute_process(COMMAND "${SEEDS}" ${TARGET} "${folder}/seeds" RESULT_VARIABLE status)
if(NOT status EQUAL 0)
  message(FATAL_ERROR "no seeds for fuzz_${TARGET}")
endif()

# No block may be much larger than the input (2048 bytes) and the code and patches (2304).
execute_process(
  COMMAND "${program}" -max_len=2048 -malloc_limit_mb=1 -rss_limit_mb=1024 -print_final_stats=1
          "-artifact_prefix=${folder}/" ${LIMIT} "${folder}/corpus" "${folder}/seeds"
  RESULT_VARIABLE status ERROR_VARIABLE text)
string(REGEX MATCH "number_of_executed_units: *([0-9]+)" found "${text}")
set(runs "${CMAKE_MATCH_1}")
if(NOT status EQUAL 0)
  string(LENGTH "${text}" length)
  if(length GREATER 6000)
    math(EXPR from "${length} - 6000")
    string(SUBSTRING "${text}" ${from} -1 text)
  endif()
  message(FATAL_ERROR "fuzz_${TARGET} found an input:\n${text}")
elseif(NOT runs GREATER 1000)
  message(FATAL_ERROR "fuzz_${TARGET} ran '${runs}' inputs: nothing was shown")
endif()
message(STATUS "${runs} inputs of fuzz_${TARGET} did no harm")
