# SPDX-License-Identifier: Apache-2.0
# Makes the tables of README.md and of the manual anew, whose facts are rows of lists. A table stands
# between the lines
#   <!-- table: NAME -->
#   <!-- end -->
# of a page, and table_NAME of a file beside this one makes it.
#   cmake -DROOT=<tree> -DOUT=<folder> -P tables.cmake
# writes the pages with tables below OUT; with OUT the tree itself they are brought up to date. With
# -DMEASURED=<folder> tables of measured figures are made as well (measured.cmake).
cmake_minimum_required(VERSION 3.25)
foreach(part rows engines distributions settings services lists measured)
  include("${CMAKE_CURRENT_LIST_DIR}/${part}.cmake")
endforeach()

set(count 0)
file(GLOB_RECURSE pages RELATIVE "${ROOT}" "${ROOT}/docs/*.md" "${ROOT}/examples/*.md")
foreach(page IN ITEMS README.md HACKING.md LISTS pages)
  if(NOT EXISTS "${ROOT}/${page}")
    continue()
  endif()
  file(READ "${ROOT}/${page}" kept)
  set(rest "${kept}")
  set(text "")
  set(tables 0)
  while(rest MATCHES "^(.*\n)?<!-- table: ([a-z_]+) -->\n")
    # The expression is greedy: this is the last table that has not been made.
    set(name ${CMAKE_MATCH_2})
    set(before "${CMAKE_MATCH_1}")
    set(mark "<!-- table: ${name} -->\n")
    string(LENGTH "${before}${mark}" start)
    string(SUBSTRING "${rest}" ${start} -1 behind)
    string(FIND "${behind}" "<!-- end -->\n" end)
    if(end EQUAL -1 OR NOT COMMAND table_${name})
      message(FATAL_ERROR "${page}: the table \"${name}\" has no end, or nothing makes it")
    endif()
    string(SUBSTRING "${behind}" 0 ${end} table)
    string(SUBSTRING "${behind}" ${end} -1 behind)
    if(NOT name IN_LIST measured_tables OR MEASURED)
      cmake_language(CALL table_${name} table)
      set(table "\n${table}\n")
    endif()
    set(text "${mark}${table}${behind}${text}")
    set(rest "${before}")
    math(EXPR tables "${tables} + 1")
  endwhile()
  if(tables)
    if(NOT OUT STREQUAL ROOT OR NOT kept STREQUAL "${rest}${text}")
      file(WRITE "${OUT}/${page}" "${rest}${text}")
    endif()
    math(EXPR count "${count} + ${tables}")
  endif()
endforeach()
if(count EQUAL 0)
  message(FATAL_ERROR "no page has a table")
endif()
message(STATUS "${count} tables")
