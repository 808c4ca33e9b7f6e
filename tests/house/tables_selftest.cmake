# SPDX-License-Identifier: Apache-2.0
# Sees that the check of tables finds a cell changed by hand, a row without its line, a table that
# nothing makes, and a variable that the sources read and no list has.
#   cmake -DROOT=<tree> -DCHECK=<tables.cmake> -DFIXTURE=<scratch folder> -P tables_selftest.cmake
cmake_minimum_required(VERSION 3.25)

# check(STATUS TEXT): fails unless the check of the fixture ends so and says that.
function(check wanted text)
  execute_process(COMMAND "${CMAKE_COMMAND}" -DROOT=${FIXTURE} -DSCRATCH=${FIXTURE}-made -P "${CHECK}"
                  RESULT_VARIABLE result OUTPUT_QUIET ERROR_VARIABLE said)
  string(REGEX REPLACE "[ \n]+" " " said "${said}")
  string(FIND "${said}" "${text}" at)
  if((wanted EQUAL 0 AND NOT result EQUAL 0) OR (NOT wanted EQUAL 0 AND result EQUAL 0)
     OR at EQUAL -1)
    message(SEND_ERROR "not \"${text}\", but ${result}: ${said}")
  endif()
endfunction()

# change(FILE FROM TO): in a fresh fixture, whose tables are right.
function(change file from to)
  file(REMOVE_RECURSE "${FIXTURE}")
  file(COPY "${ROOT}/docs" DESTINATION "${FIXTURE}" FILES_MATCHING PATTERN "*.md")
  file(COPY "${ROOT}/README.md" "${ROOT}/HACKING.md" "${ROOT}/packages.txt"
       DESTINATION "${FIXTURE}")
  file(COPY "${ROOT}/tools/tables" DESTINATION "${FIXTURE}/tools")
  file(COPY "${ROOT}/rng/engines/engines.def" DESTINATION "${FIXTURE}/rng/engines")
  file(COPY "${ROOT}/rng/distributions/distributions.def" DESTINATION "${FIXTURE}/rng/distributions")
  foreach(source core/src/settings.def lumen/src/settings.cpp statistics/src/simd/target.cpp
          offload/interop.cpp offload/routines.def forge/exceptions.def CMakeLists.txt service/opencl_functions.def service/level_zero_functions.def
          service/openmp_functions.def)
    get_filename_component(folder "${source}" DIRECTORY)
    file(COPY "${ROOT}/${source}" DESTINATION "${FIXTURE}/${folder}")
  endforeach()
  execute_process(COMMAND "${CMAKE_COMMAND}" -DROOT=${FIXTURE} -DOUT=${FIXTURE}
                          -P "${FIXTURE}/tools/tables/tables.cmake"
                  OUTPUT_QUIET COMMAND_ERROR_IS_FATAL ANY)
  file(READ "${FIXTURE}/${file}" text)
  string(REPLACE "${from}" "${to}" changed "${text}")
  if(changed STREQUAL text AND NOT from STREQUAL to)
    message(FATAL_ERROR "${file} has no ${from}")
  endif()
  file(WRITE "${FIXTURE}/${file}" "${changed}")
endfunction()

set(stale "a table is not that of the rows")
change(README.md "x" "x")
check(0 "")
change(docs/combinations.md "C G" "C")
check(1 "docs/combinations.md: ${stale}")
change(rng/engines/engines.def "R250, 32, u32, 0" "R250, 32, u32, 1")
check(1 "docs/engines/README.md: ${stale}")
change(rng/distributions/distributions.def "TARN_DISTRIBUTION(gumbel, double" "TARN_DISTRIBUTION(gumble, double")
check(1 "gumble")
change(docs/engines/README.md "table: engines" "table: motors")
check(1 "nothing makes it")
change(docs/engines/mcg59.md "state: 16" "state: 17")
check(1 "docs/engines/README.md: ${stale}")
change(docs/engines/mcg59.md "state: 16" "size: 16")
check(1 "docs/engines/mcg59.md: its facts do not tell \"state\"")
change(lumen/src/settings.cpp "LUMEN_BACKENDS" "LUMEN_BACKS")
check(1 "the sources read the variables")
change(offload/routines.def "vdRngCauchy, " "vdRngLorentz, ")
check(1 "offload/routines.def: float has")
change(forge/exceptions.def "Argument not found" "Argument not there")
check(1 "docs/forge.md: ${stale}")
change(CMakeLists.txt "option(TARN_BUILD_BENCH " "option(TARN_BUILD_MARKS ")
check(1 "docs/embedding.md: ${stale}")
