# SPDX-License-Identifier: Apache-2.0
# Seeds a small tree with one include at a time and sees that check_includes.cmake passes what
# the arrows allow and catches each kind of violation, naming the file.
#   cmake -DCHECK=<check_includes.cmake> -DFIXTURE=<scratch folder> -P includes_selftest.cmake
cmake_minimum_required(VERSION 3.25)

# One header per folder and visibility: what a folder shows, and what it keeps to itself.
set(headers
  core/include/tarn_serv.h core/src/memory.hpp
  lumen/include/sycl/sycl.hpp lumen/include/sycl/detail/task.hpp lumen/src/lumen_pool.hpp
  statistics/include/tarn_rvx.h statistics/src/block.hpp statistics/common/erfinv_tables.hpp
  statistics/common/parameters.hpp
  forge/encoder.hpp service/device_table.hpp
  rng/include/kestrel/tarn/rng.hpp rng/engines/engines.def rng/frame/launch.hpp
  offload/entries.hpp tests/laws/law.hpp bench/driver.hpp examples/helper.hpp tools/table.hpp)

file(REMOVE_RECURSE "${FIXTURE}")
foreach(header IN LISTS headers)
  file(WRITE "${FIXTURE}/${header}" "#include <cstdint>\n")
endforeach()

# expect(CAUGHT|PASSED FILE SPELLED...): puts FILE with each include in turn into the tree.
function(expect outcome file)
  foreach(spelled IN LISTS ARGN)
    file(WRITE "${FIXTURE}/${file}" "// a comment\n#include <vector>\n  #  include ${spelled}  // why\n")
    execute_process(COMMAND "${CMAKE_COMMAND}" -DROOT=${FIXTURE} -P "${CHECK}"
                    RESULT_VARIABLE result OUTPUT_QUIET ERROR_VARIABLE said)
    file(REMOVE "${FIXTURE}/${file}")
    if(outcome STREQUAL "PASSED" AND NOT result EQUAL 0)
      message(SEND_ERROR "${file} may include ${spelled}, but the check said: ${said}")
    elseif(outcome STREQUAL "CAUGHT" AND (result EQUAL 0 OR NOT said MATCHES "${file}: "))
      message(SEND_ERROR "${file} must not include ${spelled}, but the check let it pass: ${said}")
    endif()
  endforeach()
endfunction()

set(rng_public "<kestrel/tarn/rng.hpp>")
set(sycl "<sycl/sycl.hpp>")
set(serv "\"tarn_serv.h\"")
set(rvx "\"tarn_rvx.h\"")
set(list "\"rng/engines/engines.def\"")
set(rng_private "\"frame/launch.hpp\"")
set(service "\"service/device_table.hpp\"")
set(forge "\"encoder.hpp\"")
set(offload "\"offload/entries.hpp\"")
set(core_private "\"core/src/memory.hpp\"")
set(statistics_private "\"../statistics/src/block.hpp\"")
set(kernel_tables "\"statistics/common/erfinv_tables.hpp\"")
set(lumen_private "\"lumen_pool.hpp\"" "<lumen/src/lumen_pool.hpp>" "\"sycl/detail/task.hpp\""
    "\"detail/task.hpp\"")

foreach(folder core lumen)  # know nobody
  expect(PASSED ${folder}/src/own.cpp ${list})
  expect(CAUGHT ${folder}/src/own.cpp ${rng_public} ${rvx} ${rng_private} ${service} ${forge}
         ${offload} ${statistics_private})
endforeach()
expect(PASSED core/src/own.cpp ${serv} "\"memory.hpp\"")
expect(CAUGHT core/src/own.cpp ${sycl} ${lumen_private})
expect(PASSED lumen/src/own.cpp ${sycl} ${lumen_private})
expect(CAUGHT lumen/src/own.cpp ${serv} ${core_private})

foreach(folder statistics forge)  # know the core
  expect(PASSED ${folder}/own.cpp ${serv} ${list})
  expect(CAUGHT ${folder}/own.cpp ${sycl} ${rng_public} ${rng_private} ${service} ${offload}
         ${core_private} ${lumen_private})
endforeach()
expect(CAUGHT statistics/own.cpp ${forge})
expect(CAUGHT forge/own.cpp ${rvx} ${statistics_private})

expect(PASSED service/own.cpp ${serv} ${sycl} ${forge} ${list})
expect(CAUGHT service/own.cpp ${rvx} ${rng_public} ${rng_private} ${offload} ${core_private}
       ${statistics_private} ${lumen_private})

expect(PASSED rng/engines/own.cpp ${serv} ${sycl} ${rvx} ${service} ${rng_private} ${rng_public})
expect(CAUGHT rng/engines/own.cpp ${forge} ${offload} ${core_private} ${statistics_private}
       ${lumen_private})

expect(PASSED rng/distributions/own.hpp ${kernel_tables})  # data, the one exception
expect(CAUGHT rng/distributions/own.hpp "\"statistics/common/parameters.hpp\"")
foreach(folder core lumen forge service offload)
  expect(CAUGHT ${folder}/own.cpp ${kernel_tables})
endforeach()

expect(PASSED offload/own.cpp ${serv} ${sycl} ${rvx} ${service} ${rng_private} ${rng_public})
expect(CAUGHT offload/own.cpp ${forge} ${core_private} ${statistics_private} ${lumen_private})

foreach(folder tests/laws bench examples tools)  # what anyone may see
  expect(PASSED ${folder}/own.cpp ${serv} ${sycl} ${rvx} ${rng_public} ${list})
  expect(CAUGHT ${folder}/own.cpp ${rng_private} ${service} ${forge} ${offload} ${core_private}
         ${lumen_private})
endforeach()
foreach(folder tests/laws bench examples)
  expect(CAUGHT ${folder}/own.cpp ${statistics_private})
endforeach()
expect(PASSED tools/own.cpp ${statistics_private})  # whose tables they make
foreach(folder tests bench)  # what it tests or measures is open to it
  expect(PASSED ${folder}/core/own.cpp ${core_private})
  expect(CAUGHT ${folder}/core/own.cpp ${statistics_private})
endforeach()
foreach(folder core lumen statistics forge service rng offload)  # nothing builds on leaf folders
  expect(CAUGHT ${folder}/own.cpp "\"tests/laws/law.hpp\"" "\"bench/driver.hpp\""
         "\"examples/helper.hpp\"" "\"tools/table.hpp\"")
endforeach()

expect(CAUGHT rng/engines/own.cpp "TARN_HEADER")
expect(CAUGHT newcomer/own.cpp "<vector>")

# Two private headers of one name cannot hide behind each other.
file(WRITE "${FIXTURE}/lumen/src/shared_name.hpp" "#include <cstdint>\n")
file(WRITE "${FIXTURE}/service/shared_name.hpp" "#include <cstdint>\n")
expect(CAUGHT rng/frame/own.cpp "\"shared_name.hpp\"")

file(REMOVE_RECURSE "${FIXTURE}")
file(MAKE_DIRECTORY "${FIXTURE}")
execute_process(COMMAND "${CMAKE_COMMAND}" -DROOT=${FIXTURE} -P "${CHECK}"
                RESULT_VARIABLE result OUTPUT_QUIET ERROR_QUIET)
if(result EQUAL 0)
  message(SEND_ERROR "an empty tree must not pass")
endif()
