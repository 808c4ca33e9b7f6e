# SPDX-License-Identifier: Apache-2.0
# For the tests of the site: what it is made with, and what the two steps say.

# Leaves the test, with a line that begins with "skipped: ", where a program is missing.
macro(need_programs)
  foreach(program python3 mkdocs doxygen)
    find_program(${program} ${program})
    if(NOT ${program})
      message(STATUS "skipped: there is no ${program} to make the manual with")
      return()
    endif()
  endforeach()
endmacro()

# make_site(STATUS SAID ROOT OUT) and check_site(STATUS SAID FOLDER ROOT)
function(make_site status said root out)
  execute_process(COMMAND "${python3}" "${TOOLS}/make_site.py" "${root}" "${out}"
                  RESULT_VARIABLE result OUTPUT_VARIABLE text ERROR_VARIABLE text)
  set(${status} "${result}" PARENT_SCOPE)
  set(${said} "${text}" PARENT_SCOPE)
endfunction()
function(check_site status said folder root)
  execute_process(COMMAND "${python3}" "${TOOLS}/check_site.py" "${folder}" "${root}"
                  RESULT_VARIABLE result OUTPUT_VARIABLE text ERROR_VARIABLE text)
  set(${status} "${result}" PARENT_SCOPE)
  set(${said} "${text}" PARENT_SCOPE)
endfunction()
