# SPDX-License-Identifier: Apache-2.0
# Proves that every engine and every distribution has its page, and each page the parts that readers
# look for: formula, words, accuracy, a figure and so on.
#   cmake -DROOT=<tree> -P cmake/check_pages.cmake
cmake_minimum_required(VERSION 3.25)
set(engine_parts "**(Recurrence|Source).**" "**Period.**" "**Word.**" "**Reals.**" "**Seeding.**"
    "**Skips" "**Good for**" "**Known to fail:**")
set(distribution_parts "**Law.**" "**C.**" "**C++.**" "**Words" "**Accuracy.**" "**Edges.**")
set(wrong "")

# names(OUT LIST MACRO): the first fields of the rows of a list.
function(names out list macro)
  file(STRINGS "${ROOT}/rng/${list}" rows REGEX "^${macro}\\(")
  list(TRANSFORM rows REPLACE "^${macro}\\(([a-z0-9_]+),.*" "\\1")
  list(REMOVE_DUPLICATES rows)
  set(${out} "${rows}" PARENT_SCOPE)
endfunction()

# check_page(FOLDER NAME PART...): its title, parts and figures.
function(check_page folder name)
  set(page "docs/${folder}/${name}.md")
  if(NOT EXISTS "${ROOT}/${page}")
    set(wrong "${wrong}there is no ${page}\n" PARENT_SCOPE)
    return()
  endif()
  file(READ "${ROOT}/${page}" text)
  set(missing "")
  if(NOT text MATCHES "^# ${name}[,\n]")
    string(APPEND missing "${page}: its title is another one\n")
  endif()
  foreach(part IN LISTS ARGN)
    string(REGEX REPLACE "([*.+])" "\\\\\\1" pattern "${part}")
    if(NOT text MATCHES "\n${pattern}")
      string(APPEND missing "${page}: no paragraph ${part}\n")
    endif()
  endforeach()
  if(NOT text MATCHES "\\]\\(${name}\\.svg\\)")
    string(APPEND missing "${page}: no figure ${name}.svg\n")
  endif()
  string(REGEX MATCHALL "\\([a-z0-9_]+\\.svg\\)" figures "${text}")
  foreach(figure IN LISTS figures)
    string(REGEX REPLACE "\\((.*)\\)" "\\1" figure "${figure}")
    if(NOT EXISTS "${ROOT}/docs/${folder}/${figure}")
      string(APPEND missing "${page}: there is no ${figure}: ./run gallery makes it\n")
    endif()
  endforeach()
  set(wrong "${wrong}${missing}" PARENT_SCOPE)
endfunction()

# check_others(FOLDER NAME...): pages that belong to no row.
function(check_others folder)
  file(GLOB pages RELATIVE "${ROOT}/docs/${folder}" "${ROOT}/docs/${folder}/*.md")
  list(TRANSFORM pages REPLACE "\\.md$" "")
  list(REMOVE_ITEM pages README devices ${ARGN})  # overviews
  foreach(page IN LISTS pages)
    set(wrong "${wrong}docs/${folder}/${page}.md: no row has this name\n" PARENT_SCOPE)
  endforeach()
endfunction()

names(engines engines/engines.def TARN_ENGINE)
foreach(engine IN LISTS engines)
  check_page(engines ${engine} ${engine_parts})
endforeach()
check_others(engines ${engines})
names(distributions distributions/distributions.def TARN_DISTRIBUTION)
list(REMOVE_ITEM distributions uniform_bits)  # on the page of bits
foreach(distribution IN LISTS distributions)
  set(parts ${distribution_parts})
  if(NOT distribution STREQUAL "bits")  # words as they are
    list(APPEND parts "**(Method|Words and methods)")
  endif()
  check_page(distributions ${distribution} ${parts})
endforeach()
check_others(distributions ${distributions})

list(LENGTH engines engine_count)
list(LENGTH distributions distribution_count)
if(engine_count EQUAL 0 OR distribution_count EQUAL 0)
  message(FATAL_ERROR "no rows below ${ROOT}/rng: nothing was checked")
endif()
if(wrong)
  message(FATAL_ERROR "${wrong}")
endif()
message(STATUS "${engine_count} engines and ${distribution_count} distributions have their pages")
