# SPDX-License-Identifier: Apache-2.0
# Sees that a real program of benchmarks, cut short, says what the report needs.
#   cmake -DPROGRAM=<bench_speed> -DTOOLS=<tools/bench_report> -DSCRATCH=<folder> -P whole_road.cmake
cmake_minimum_required(VERSION 3.25)
foreach(program jq gnuplot)
  find_program(path_${program} ${program})
  if(NOT path_${program})
    message("skipped: no ${program}")
    return()
  endif()
endforeach()
file(REMOVE_RECURSE "${SCRATCH}")
file(MAKE_DIRECTORY "${SCRATCH}")
execute_process(
  COMMAND "${PROGRAM}" "--benchmark_filter=^uniform/(tarn|boost)/"
          "--benchmark_out=${SCRATCH}/bench_speed.json"
  RESULT_VARIABLE status OUTPUT_VARIABLE said ERROR_VARIABLE said)
if(NOT status EQUAL 0)
  message(FATAL_ERROR "${PROGRAM}: status ${status}, said:\n${said}")
endif()
execute_process(COMMAND "${TOOLS}/report.sh" "${SCRATCH}/bench_speed.json" "${SCRATCH}"
                RESULT_VARIABLE status ERROR_VARIABLE said)
file(READ "${SCRATCH}/bench_speed.md" report)
set(rate "[0-9.]+ [kMG]?/s")
set(row "\\| `uniform/tarn` \\| ${rate} \\| `uniform/boost` \\| ${rate} \\| [0-9.]+ \\|\n")
if(NOT status EQUAL 0 OR NOT report MATCHES "## peers\n\n\\|  \\| Rate [^\n]*\n[^\n]*\n${row}")
  message(FATAL_ERROR "status ${status}, said:\n${said}\nreport:\n${report}")
endif()
