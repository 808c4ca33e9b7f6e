# SPDX-License-Identifier: Apache-2.0
# Sees that tools/tally.awk counts a run with every kind of outcome in it as it should.
#   cmake -DTALLY=<tally.awk> -P tally_selftest.cmake
cmake_minimum_required(VERSION 3.25)
set(fixture "${CMAKE_CURRENT_LIST_DIR}/tally")

# tally(FILE): counts it, into `result` and `said`.
macro(tally file)
  execute_process(COMMAND awk -v "cases=${fixture}/cases" -f "${TALLY}" "${file}"
                  RESULT_VARIABLE result OUTPUT_VARIABLE said ERROR_VARIABLE said)
endmacro()

# Passed: two cases of unit_mixed, two each of unit_good and unit_leaked, and house_script.
tally("${fixture}/ctest.xml")
set(wanted [[

Failed:
  unit_mixed box.closes
  unit_mixed all/box.holds/1
  unit_crashed
  unit_cut_off
  unit_leaked: the program failed, though no case did
  house_bad
  unit_missing: Unable to find executable

Skipped:
  unit_mixed box.turns: no GPU & no "driver"
  unit_mixed box.DISABLED_flies: disabled
  house_skipped: no compiler for it

7 passed, 7 failed, 3 skipped
]])
if(NOT said STREQUAL wanted OR result EQUAL 0)
  message(SEND_ERROR "status ${result}, said:\n${said}\ninstead of:\n${wanted}")
endif()

file(WRITE "${CMAKE_CURRENT_BINARY_DIR}/one.xml"
     "<testcase name=\"unit_good\" status=\"run\">\n</testcase>\n")
tally("${CMAKE_CURRENT_BINARY_DIR}/one.xml")
if(NOT said STREQUAL "\n2 passed, 0 failed, 0 skipped\n" OR NOT result EQUAL 0)
  message(SEND_ERROR "a good run: status ${result}, said:\n${said}")
endif()

file(WRITE "${CMAKE_CURRENT_BINARY_DIR}/none.xml" "<testsuite name=\"(empty)\"\n\ttests=\"0\"/>\n")
tally("${CMAKE_CURRENT_BINARY_DIR}/none.xml")
if(NOT said MATCHES "\n0 passed, 0 failed, 0 skipped\n$" OR result EQUAL 0)
  message(SEND_ERROR "a run without tests: status ${result}, said:\n${said}")
endif()
