# SPDX-License-Identifier: Apache-2.0
# Sees that check_device_sources.cmake passes standard code, catches each kind of breach by name,
# and refuses a tree that uses no SYCL at all.
#   cmake -DCHECK=<check_device_sources.cmake> -DFIXTURE=<scratch folder> -P <this>
cmake_minimum_required(VERSION 3.25)

# check(TEXT): runs the check over a tree of one file.
macro(check text)
  file(REMOVE_RECURSE "${FIXTURE}")
  file(WRITE "${FIXTURE}/rng/engines/a.hpp" "${text}\n")
  execute_process(COMMAND "${CMAKE_COMMAND}" -DROOT=${FIXTURE} -P "${CHECK}"
                  RESULT_VARIABLE result OUTPUT_VARIABLE said ERROR_VARIABLE error)
endmacro()

check("int x;")
if(result EQUAL 0)
  message(SEND_ERROR "a tree without SYCL must not pass")
endif()
check("sycl::queue q\; sycl::mad(a, b, c)\;  // not lumen's own sycl::lgamma")
if(NOT result EQUAL 0)
  message(SEND_ERROR "standard code must pass: ${said} ${error}")
endif()
foreach(breach "sycl::lgamma" "sycl::reduce_over_group" "sycl::ext::own::thing" "ext_own_thing"
        "__clang__" "lumen" "using namespace sycl")
  check("sycl::queue q\; ${breach}(x)\;")
  string(FIND "${said}" "rng/engines/a.hpp: " at)
  if(result EQUAL 0 OR at EQUAL -1)
    message(SEND_ERROR "${breach} must be caught by name, but the check said: ${said}")
  endif()
endforeach()
