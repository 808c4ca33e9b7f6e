# SPDX-License-Identifier: Apache-2.0
# Sees that the gallery has a figure for every engine and every family of distributions, that the
# figures show what they should, and that those of the manual are these.
#   cmake -DROOT=<tree> -DGALLERY=<program> -DSCRATCH=<folder> -P gallery.cmake
cmake_minimum_required(VERSION 3.25)
foreach(program gnuplot xmllint)
  find_program(path_${program} ${program})
  if(NOT path_${program})
    message("skipped: no ${program}")
    return()
  endif()
endforeach()
file(REMOVE_RECURSE "${SCRATCH}")
file(MAKE_DIRECTORY "${SCRATCH}")
set(most_bytes 60000)  # a page of the gallery has some forty

# first_fields(OUT FILE MACRO): the first field of each row, each once.
function(first_fields out file macro)
  file(STRINGS "${ROOT}/rng/${file}" names REGEX "^${macro}\\(")
  list(TRANSFORM names REPLACE "^${macro}\\(([a-z0-9_]+),.*" "\\1")
  list(REMOVE_DUPLICATES names)
  if(NOT names)
    message(FATAL_ERROR "no rows in ${file}")
  endif()
  set(${out} "${names}" PARENT_SCOPE)
endfunction()

function(draw)
  execute_process(COMMAND "${ROOT}/tools/plots/draw.sh" "${GALLERY}" "${SCRATCH}/docs"
                          "${SCRATCH}/columns"
                  RESULT_VARIABLE status OUTPUT_VARIABLE said ERROR_VARIABLE said)
  if(NOT status EQUAL 0 OR NOT said STREQUAL "")
    message(FATAL_ERROR "drawing: status ${status}, said:\n${said}")
  endif()
endfunction()

draw()
file(GLOB_RECURSE made RELATIVE "${SCRATCH}/docs" "${SCRATCH}/docs/*")
foreach(file IN LISTS made)
  file(SHA256 "${SCRATCH}/docs/${file}" "first_${file}")
endforeach()

# ---- A figure for every row, of a fair size, well-formed, and shown in the page.
first_fields(engines engines/engines.def TARN_ENGINE)
first_fields(families distributions/distributions.def TARN_DISTRIBUTION)
list(TRANSFORM engines PREPEND engines/ OUTPUT_VARIABLE figures)
list(TRANSFORM families PREPEND distributions/)
list(APPEND figures ${families})
file(READ "${SCRATCH}/docs/gallery.md" page)
foreach(figure IN LISTS figures)
  set(file "${SCRATCH}/docs/${figure}.svg")
  if(NOT EXISTS "${file}")
    message(SEND_ERROR "no figure ${figure}")
    continue()
  endif()
  file(SIZE "${file}" bytes)
  if(bytes GREATER most_bytes)
    message(SEND_ERROR "${figure} has ${bytes} bytes")
  endif()
  execute_process(COMMAND xmllint --noout "${file}" RESULT_VARIABLE status ERROR_VARIABLE said)
  if(NOT status EQUAL 0)
    message(SEND_ERROR "not well-formed: ${said}")
  endif()
  string(FIND "${page}" "(${figure}.svg)" at)
  if(at EQUAL -1)
    message(SEND_ERROR "gallery.md does not show ${figure}")
  endif()
endforeach()

# ---- Points: as many as the caption says, and of sobol those that everybody's tables begin with:
# (1/2, 1/2), (3/4, 1/4), (1/4, 3/4), the second coordinate upwards.
foreach(engine IN LISTS engines)
  file(READ "${SCRATCH}/docs/engines/${engine}.svg" text)
  string(REGEX MATCHALL "M[0-9]+ [0-9]+h0" points "${text}")
  list(LENGTH points count)
  if(NOT count EQUAL 1024)
    message(SEND_ERROR "${engine}: ${count} points")
  endif()
endforeach()
file(READ "${SCRATCH}/docs/engines/sobol.svg" text)
string(FIND "${text}" "d=\"\nM500 500h0 M750 750h0 M250 250h0 " at)
if(at EQUAL -1)
  message(SEND_ERROR "sobol begins with other points:\n${text}")
endif()

# A lattice of 2^31 - 2 points in the square has 954 for each 1/1500^2 of it, and more or less by
# some of those along the border, of which there are 4 sqrt(954) = 124.
file(READ "${SCRATCH}/docs/engines/mcg31m1_lattice.svg" text)
string(REGEX MATCHALL "M[0-9]+ [0-9]+h0" points "${text}")
list(LENGTH points count)
if(count LESS 892 OR count GREATER 1016)
  message(SEND_ERROR "mcg31m1_lattice: ${count} points")
endif()

# ---- Bars stand at the height of the law, within 4 of 100 of its highest. The flattest laws have some
# 14000 values in a bar, a deviation of 0.84 of 100; what the middle of a bar misses of its mean is below
# 2 (weibull, near 0), where bars are long.
file(GLOB columns "${SCRATCH}/columns/*.density" "${SCRATCH}/columns/*.probabilities")
list(LENGTH columns count)
list(LENGTH families wanted)
if(NOT count EQUAL wanted)
  message(SEND_ERROR "${count} files of columns instead of ${wanted}")
endif()
foreach(file IN LISTS columns)
  execute_process(
    COMMAND awk "FNR > 1 { d = $2 > $3 ? $2 - $3 : $3 - $2; if (d > far) far = d; if ($3 > top) top = $3 }
                 END { exit !(FNR > 3 && top > 0 && far <= 0.04 * top) }" "${file}"
    RESULT_VARIABLE status)
  if(NOT status EQUAL 0)
    message(SEND_ERROR "${file}: bars are not those of the law")
  endif()
endforeach()

# ---- Drawn again, all is the same to the byte; what no run repeats is left alone.
draw()
foreach(file IN LISTS made)
  file(SHA256 "${SCRATCH}/docs/${file}" again)
  if(NOT again STREQUAL "${first_${file}}")
    message(SEND_ERROR "${file} is another one when it is drawn again")
  endif()
endforeach()

# ---- The manual has these. Other versions of gnuplot, which sign their files, may draw otherwise.
foreach(file IN LISTS made)
  if(NOT EXISTS "${ROOT}/docs/${file}")
    message(SEND_ERROR "docs/${file} is missing: ./run gallery")
    continue()
  endif()
  file(READ "${SCRATCH}/docs/${file}" new)
  file(READ "${ROOT}/docs/${file}" kept)
  string(REGEX MATCH "<desc>[^<]*</desc>" new_maker "${new}")
  string(REGEX MATCH "<desc>[^<]*</desc>" kept_maker "${kept}")
  if(NOT file STREQUAL "engines/nondeterministic.svg" AND new_maker STREQUAL kept_maker
     AND NOT new STREQUAL kept)
    message(SEND_ERROR "docs/${file} is not what is drawn now: ./run gallery")
  endif()
endforeach()
