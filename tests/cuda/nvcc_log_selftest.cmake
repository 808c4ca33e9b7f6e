# SPDX-License-Identifier: Apache-2.0
# Sees that tools/nvcc_log.sh keeps what ptxas says, passes the rest on and ends as the compiler did,
# with a script for a compiler.
#   cmake -DLAUNCHER=<nvcc_log.sh> -DFIXTURE=<scratch folder> -P nvcc_log_selftest.cmake
cmake_minimum_required(VERSION 3.25)
file(REMOVE_RECURSE "${FIXTURE}")
file(WRITE "${FIXTURE}/compiler" [[
#!/bin/sh
# Writes its arguments, one a line, and ends with the status STATUS.
echo "note for the user"
for argument; do echo "argument: $argument"; done
cat >&2 <<'TEXT'
unit.cpp(3): warning: something about ptxas info here
ptxas info    : 0 bytes gmem
ptxas info    : Compiling entry function 'k' for 'sm_90'
ptxas info    : Function properties for k
    0 bytes stack frame, 0 bytes spill stores, 0 bytes spill loads
ptxas info    : Used 8 registers, used 0 barriers
ptxas warning : something about registers
TEXT
exit ${STATUS:-0}
]])
file(CHMOD "${FIXTURE}/compiler" PERMISSIONS OWNER_READ OWNER_WRITE OWNER_EXECUTE)
set(log "${FIXTURE}/logs/a unit.log")

# launch(STATUS ARGUMENT...): into `result`, `out` and `err`.
macro(launch status)
  execute_process(COMMAND ${CMAKE_COMMAND} -E env STATUS=${status} "${LAUNCHER}" "${FIXTURE}/logs"
                          "${FIXTURE}/compiler" ${ARGN}
                  RESULT_VARIABLE result OUTPUT_VARIABLE out ERROR_VARIABLE err)
endmacro()

# wants(WHAT ACTUAL EXPECTED)
function(wants what actual expected)
  if(NOT actual STREQUAL expected)
    message(SEND_ERROR "${what}:\n${actual}\ninstead of:\n${expected}")
  endif()
endfunction()

set(warnings [[unit.cpp(3): warning: something about ptxas info here
ptxas warning : something about registers
]])
launch(0 "-DTEXT=two words" -x cu -c "/folder/a unit.cpp" -o object.o)
wants("status" "${result}" 0)
wants("output" "${out}" [[note for the user
argument: -DTEXT=two words
argument: -x
argument: cu
argument: -c
argument: /folder/a unit.cpp
argument: -o
argument: object.o
]])
wants("warnings" "${err}" "${warnings}")
file(READ "${log}" kept)
wants("log" "${kept}" [[ptxas info    : 0 bytes gmem
ptxas info    : Compiling entry function 'k' for 'sm_90'
ptxas info    : Function properties for k
    0 bytes stack frame, 0 bytes spill stores, 0 bytes spill loads
ptxas info    : Used 8 registers, used 0 barriers
]])

# A unit that does not compile leaves nothing of an earlier run.
launch(3 -c "/folder/a unit.cpp")
wants("status of a failure" "${result}" 3)
wants("warnings of a failure" "${err}" "${warnings}")
file(GLOB left "${FIXTURE}/logs/*")
wants("logs after a failure" "${left}" "")

# Without a source nothing is kept or held back.
launch(5 --version)
wants("status without a source" "${result}" 5)
if(NOT err MATCHES "Used 8 registers")
  message(SEND_ERROR "held back: ${err}")
endif()
file(GLOB left "${FIXTURE}/logs/*")
wants("logs without a source" "${left}" "")
