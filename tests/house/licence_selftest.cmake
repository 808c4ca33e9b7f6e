# SPDX-License-Identifier: Apache-2.0
# Sees that check_licence.cmake passes a tree of marked files, catches each kind of file without
# the mark by name, and refuses an empty tree.
#   cmake -DCHECK=<check_licence.cmake> -DFIXTURE=<scratch folder> -P licence_selftest.cmake
cmake_minimum_required(VERSION 3.25)
set(mark "SPDX-License-Identifier: Apache-2.0\n")

# check(RESULT SAID): runs the check over the fixture.
macro(check)
  execute_process(COMMAND "${CMAKE_COMMAND}" -DROOT=${FIXTURE} -P "${CHECK}"
                  RESULT_VARIABLE result OUTPUT_QUIET ERROR_VARIABLE said)
endmacro()

file(REMOVE_RECURSE "${FIXTURE}")
file(MAKE_DIRECTORY "${FIXTURE}")
check()
if(result EQUAL 0)
  message(SEND_ERROR "an empty tree must not pass")
endif()

file(WRITE "${FIXTURE}/core/src/marked.cpp" "// ${mark}int x;\n")
file(WRITE "${FIXTURE}/build-x/made.cpp" "int made;\n")
check()
if(NOT result EQUAL 0)
  message(SEND_ERROR "a marked tree must pass: ${said}")
endif()

foreach(file core/a.cpp core/b.hpp rng/c.def lumen/d.cu cmake/e.cmake rng/exports.map
        tools/f.awk tools/f.py tools/g.sh offload/h.f90 core/CMakeLists.txt run .ci/run)
  file(WRITE "${FIXTURE}/${file}" "\n\n\n# ${mark}")  # too far down
  check()
  string(FIND "${said}" "${file}: " at)
  if(result EQUAL 0 OR at EQUAL -1)
    message(SEND_ERROR "${file} has no mark at its top, but the check said: ${said}")
  endif()
  file(REMOVE "${FIXTURE}/${file}")
endforeach()
