# SPDX-License-Identifier: Apache-2.0
# Counts the instructions of the entry `generate` itself, without what it calls, in a program that
# calls it 1000 times while verbose reports are off:
#   cmake -DVALGRIND=<tool> -DANNOTATE=<callgrind_annotate> -DPROGRAM=<file> -DSCRATCH=<folder>
#         -DMOST=<instructions a call> -P verbose_cost.cmake
cmake_minimum_required(VERSION 3.25)
if(NOT VALGRIND OR NOT ANNOTATE)
  message(STATUS "skipped: there is no valgrind to count instructions with")
  return()
endif()
set(counts "${SCRATCH}/verbose_cost.callgrind")
file(REMOVE "${counts}")
execute_process(COMMAND "${VALGRIND}" --tool=callgrind "--callgrind-out-file=${counts}" "${PROGRAM}"
                OUTPUT_VARIABLE said ERROR_VARIABLE told RESULT_VARIABLE status)
if(NOT status EQUAL 0 OR NOT said MATCHES "1000 calls")
  message(FATAL_ERROR "the program did not run: ${told}")
endif()
execute_process(COMMAND "${ANNOTATE}" --threshold=100 --show-percs=no "${counts}"
                OUTPUT_VARIABLE table COMMAND_ERROR_IS_FATAL ANY)
# The frame behind the entry has to be there as well: otherwise it was drawn into the entry.
if(NOT table MATCHES "rng::detail::generate_on_device<")
  message(FATAL_ERROR "the frame behind the entry is not in the table:\n${table}")
endif()
string(REGEX MATCH "\n *([0-9,]+)[^\n]*tarn::rng::generate<" row "${table}")
string(REPLACE "," "" count "${CMAKE_MATCH_1}")
if(NOT count MATCHES "^[0-9]+$" OR count LESS 1000)
  message(FATAL_ERROR "no count for the entry:\n${table}")
endif()
math(EXPR each "${count} / 1000")
if(each GREATER MOST)
  message(FATAL_ERROR "the entry takes ${each} instructions a call, more than ${MOST}")
endif()
message(STATUS "the entry takes ${count} instructions in 1000 calls")
