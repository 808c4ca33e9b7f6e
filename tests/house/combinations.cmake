# SPDX-License-Identifier: Apache-2.0
# Sees that docs/combinations.md is what its maker makes of the present rows.
#   cmake -DROOT=<tree> -DSCRATCH=<folder> -P combinations.cmake
cmake_minimum_required(VERSION 3.25)
execute_process(
  COMMAND ${CMAKE_COMMAND} -DROOT=${ROOT} -DOUT=${SCRATCH}/combinations.md
          -P "${ROOT}/tools/combinations/combinations.cmake"
  RESULT_VARIABLE status)
file(READ "${SCRATCH}/combinations.md" made)
file(READ "${ROOT}/docs/combinations.md" kept)
if(status OR NOT made STREQUAL kept)
  message(FATAL_ERROR "docs/combinations.md is not that of the rows: ./run tables makes it anew")
endif()
