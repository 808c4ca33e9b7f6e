# SPDX-License-Identifier: Apache-2.0
# Sees that check_names.cmake finds each kind of name that is not there.
#   cmake -DROOT=<tree> -DCHECK=<check_names.cmake> -DFIXTURE=<scratch folder> -P names_selftest.cmake
cmake_minimum_required(VERSION 3.25)

# check(TEXT): fails unless the check of the fixture says that; with no text, unless it passes.
function(check text)
  execute_process(COMMAND "${CMAKE_COMMAND}" -DROOT=${FIXTURE} -P "${CHECK}"
                  RESULT_VARIABLE result OUTPUT_QUIET ERROR_VARIABLE said)
  string(REGEX REPLACE "[ \n]+" " " said "${said}")
  string(FIND "${said}" "${text}" at)
  if((text STREQUAL "" AND NOT result EQUAL 0) OR (text AND result EQUAL 0) OR at EQUAL -1)
    message(SEND_ERROR "not \"${text}\", but ${result}: ${said}")
  endif()
endfunction()

file(REMOVE_RECURSE "${FIXTURE}")
file(WRITE "${FIXTURE}/run" "cat\nusage: ./run COMMAND\n\n  fly   to flyer\nTEXT\n  flyer\n")
file(WRITE "${FIXTURE}/README.md" "# Nothing\n")
file(WRITE "${FIXTURE}/HACKING.md" "# Nothing\n")
file(WRITE "${FIXTURE}/CMakeLists.txt" "option(TARN_WINGS)\n")
file(WRITE "${FIXTURE}/tests/CMakeLists.txt" "tarn_test(unit_wing SOURCES x)\n")
file(WRITE "${FIXTURE}/statistics/include/tarn_rvx.h" "void rvxFly();\n#define RVX_FLY 1\n")
file(WRITE "${FIXTURE}/offload/include/tarn_rvx_offload.h" "\n")
file(WRITE "${FIXTURE}/rng/distributions/distributions.def" "(flat<float, flat_method::wide>)\n")
file(WRITE "${FIXTURE}/docs/page.md" "nothing\n")
check("nothing was checked")

set(right "`unit_wing` `rvxFly`, `RVX_FLY` `flat<T, flat_method::wide>` `TARN_WINGS` `./run fly`\n")
file(WRITE "${FIXTURE}/docs/page.md" "${right}")
check("")
foreach(change "unit_wing|unit_wings|test" "rvxFly|rvxFl|C name" "RVX_FLY|RVX_FLYER|C name"
        "method::wide|method::wid|method" "TARN_WINGS|TARN_WING|variable" "run fly|run flyer|command")
  string(REPLACE "|" ";" change "${change}")
  list(GET change 0 from)
  list(GET change 1 to)
  list(GET change 2 what)
  string(REPLACE "${from}" "${to}" text "${right}")
  file(WRITE "${FIXTURE}/docs/page.md" "${text}")
  check("docs/page.md: there is no ${what} ")
endforeach()
