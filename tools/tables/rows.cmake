# SPDX-License-Identifier: Apache-2.0
# The facts that tables are made of: rows of lists, and what a page says of itself.

# rows(OUT FILE MACRO): the rows of a list, each as its text between the parentheses, its fields
# split by "|". Commas inside a type become blanks.
function(rows out file macro)
  file(STRINGS "${ROOT}/rng/${file}" lines REGEX "^${macro}\\(")
  set(found "")
  foreach(line IN LISTS lines)
    string(REGEX REPLACE "^${macro}\\((.*)\\)$" "\\1" row "${line}")
    string(REGEX REPLACE " \\(.*\\)," " type," row "${row}")
    string(REPLACE ", " "|" row "${row}")
    list(APPEND found "${row}")
  endforeach()
  if(NOT found)
    message(FATAL_ERROR "no row of ${macro} in ${file}")
  endif()
  set(${out} "${found}" PARENT_SCOPE)
endfunction()

# fields(ROW NAME...): the fields of a row as variables of these names, in order.
function(fields row)
  string(REPLACE "|" ";" values "${row}")
  foreach(name value IN ZIP_LISTS ARGN values)
    set(${name} "${value}" PARENT_SCOPE)
  endforeach()
endfunction()

macro(engine_fields row)
  fields("${row}" name code label word_bits seed_type gpu skip skip_list leapfrog uniform_bits)
endmacro()

macro(distribution_fields row)
  fields("${row}" family result method type words road gpu)
endmacro()

# fact(OUT PAGE KEY [FALLBACK]): the line "KEY: text" of the comment "facts" of a page in docs/.
function(fact out page key)
  file(READ "${ROOT}/docs/${page}" text)
  string(REGEX MATCH "<!-- facts\n(([^-]|-[^-]|--[^>])*)\n-->" ignored "${text}")
  if("\n${CMAKE_MATCH_1}\n" MATCHES "\n${key}: ([^\n]*)\n")
    set(${out} "${CMAKE_MATCH_1}" PARENT_SCOPE)
  elseif(ARGC GREATER 3)
    set(${out} "${ARGV3}" PARENT_SCOPE)
  else()
    message(FATAL_ERROR "docs/${page}: its facts do not tell \"${key}\"")
  endif()
endfunction()

# yes(OUT FLAG): what a cell says of a flag; a blank, since empty elements get lost in lists.
function(yes out flag)
  if(flag)
    set(${out} "yes" PARENT_SCOPE)
  else()
    set(${out} " " PARENT_SCOPE)
  endif()
endfunction()

# line(TO CELL...): appends a line. A cell of a blank is empty.
function(line to)
  set(text "|")
  math(EXPR last "${ARGC} - 1")
  foreach(index RANGE 1 ${last})  # not as a list: cells may have semicolons
    string(STRIP " ${ARGV${index}}" cell)
    string(APPEND text " ${cell} |")
  endforeach()
  string(REPLACE "|  |" "| |" text "${text}")
  string(REPLACE "|  |" "| |" text "${text}")
  set(${to} "${${to}}${text}\n" PARENT_SCOPE)
endfunction()

# head(TO CELL...): the first two lines.
function(head to)
  set(lines "")
  line(lines ${ARGN})
  list(LENGTH ARGN columns)
  string(REPEAT "---|" ${columns} rule)
  set(${to} "${lines}|${rule}\n" PARENT_SCOPE)
endfunction()

# page_of(OUT FAMILY): the page of a distribution, relative to docs/.
function(page_of out family)
  if(family STREQUAL "uniform_bits")
    set(family bits)
  endif()
  set(${out} "distributions/${family}.md" PARENT_SCOPE)
endfunction()

# families(OUT): the distributions in the order of their rows.
function(families out)
  rows(all distributions/distributions.def TARN_DISTRIBUTION)
  list(TRANSFORM all REPLACE "\\|.*" "")
  list(REMOVE_DUPLICATES all)
  set(${out} "${all}" PARENT_SCOPE)
endfunction()
