# SPDX-License-Identifier: Apache-2.0
# Tables of what test programs print, which `./run tables` runs first: MEASURED is the folder with
# their outputs. Without it, as in the tests, these tables stay as they are: the last digits of
# elementary functions are the C library's, and the tests hold the figures below their bounds.

# said(OUT PROGRAM PATTERN): the lines of a program's output that match.
function(said out program pattern)
  file(STRINGS "${MEASURED}/${program}.txt" lines REGEX "${pattern}")
  if(NOT lines)
    message(FATAL_ERROR "${program} has printed nothing for its table")
  endif()
  set(${out} "${lines}" PARENT_SCOPE)
endfunction()

# Host and device, in units in the last place: a line for each method.
function(table_differences out)
  set(form "^philox4x32x10 +([a-z_]+) +(float|double) +([a-z0-9_]+) +standard +([0-9]+)\\.[0-9]+ places, ([01]\\.[0-9]+)")
  said(lines closed_form_roads "${form}")
  set(rows "")
  foreach(text IN LISTS lines)
    string(REGEX MATCH "${form}" ignored "${text}")
    set(row "${CMAKE_MATCH_1} ${CMAKE_MATCH_3}")
    list(APPEND rows "${row}")
    set(${row}_${CMAKE_MATCH_2} ${CMAKE_MATCH_4})
    if(CMAKE_MATCH_1 STREQUAL "gumbel")
      # It passes 0, so its unit is that of max(|x|, 1), of which four are allowed.
      string(REPLACE "." "" hundredths "${CMAKE_MATCH_5}")
      math(EXPR ${row}_${CMAKE_MATCH_2} "(4 * (1${hundredths} - 1000) + 50) / 100")
    endif()
  endforeach()
  list(REMOVE_DUPLICATES rows)
  head(table "Distribution" "Method" "`float`" "`double`")
  foreach(row IN LISTS rows)
    string(REPLACE " " ";" words "${row}")
    list(GET words 0 family)
    list(GET words 1 method)
    line(table "`${family}`" "`${method}`" "${${row}_float}" "${${row}_double}")
  endforeach()
  set(${out} "${table}" PARENT_SCOPE)
endfunction()

# Total variation of inversion on the host to Poisson's law.
function(table_poisson_on_hosts out)
  head(table "lambda" "`gaussian_icdf_based`" "`poisson_v`" "inversion without fault")
  said(lines poisson_inversion "^\\| [0-9]")
  list(JOIN lines "\n" lines)
  set(${out} "${table}${lines}\n" PARENT_SCOPE)
endfunction()

# The same of the device's inversions.
function(table_poisson_on_devices out)
  head(table "lambda" "`poisson`" "`poisson_v`")
  set(form "^ +([0-9.e+]+|largest) +([0-9.e-]+) +([0-9.e-]+)$")
  said(lines poisson_tables "${form}")
  foreach(text IN LISTS lines)
    string(REGEX MATCH "${form}" ignored "${text}")
    string(REPLACE "largest" "the largest of all 200" lambda "${CMAKE_MATCH_1}")
    line(table "${lambda}" "${CMAKE_MATCH_2}" "${CMAKE_MATCH_3}")
  endforeach()
  set(${out} "${table}" PARENT_SCOPE)
endfunction()

# What the words of drivers say of a device.
function(table_architectures out)
  head(table "Major" "Release" "Architecture" "Flags")
  said(lines architectures "^\\| [0-9]")
  list(JOIN lines "\n" lines)
  set(${out} "${table}${lines}\n" PARENT_SCOPE)
endfunction()

set(measured_tables architectures differences poisson_on_hosts poisson_on_devices)
