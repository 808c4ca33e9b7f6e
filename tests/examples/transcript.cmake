# SPDX-License-Identifier: Apache-2.0
# Sees that the commands of one section of examples/README.md end well and print what stands below them.
#   cmake -DREADME=<file> -DSECTION=<title> -DEXAMPLES=<folder> -DPROGRAMS=<folder> -DSCRATCH=<folder>
#         -P transcript.cmake
# The commands run in SCRATCH, where examples/ and build/release/bin/ are as in the tree. In the text
# `...` stands for anything within a line, and a line `...` for any lines.
cmake_minimum_required(VERSION 3.25)

file(READ "${README}" text)
set(fence "```")
string(FIND "${text}" "\n## ${SECTION}\n" start)
if(start EQUAL -1)
  message(FATAL_ERROR "${README} has no section '${SECTION}'")
endif()
string(SUBSTRING "${text}" ${start} -1 text)
string(SUBSTRING "${text}" 1 -1 text)
string(FIND "${text}" "\n## " end)
string(SUBSTRING "${text}" 0 ${end} text)
if(NOT text MATCHES "\n${fence}sh\n(.*)\n${fence}\n.*\n${fence}text\n(.*)${fence}\n")
  message(FATAL_ERROR "section '${SECTION}' has no commands with their output")
endif()
set(commands "${CMAKE_MATCH_1}")
set(wanted "${CMAKE_MATCH_2}")

file(REMOVE_RECURSE "${SCRATCH}")
file(MAKE_DIRECTORY "${SCRATCH}/build/release")
file(CREATE_LINK "${EXAMPLES}" "${SCRATCH}/examples" SYMBOLIC)
file(CREATE_LINK "${PROGRAMS}" "${SCRATCH}/build/release/bin" SYMBOLIC)
execute_process(COMMAND sh -eu -c "${commands}" WORKING_DIRECTORY "${SCRATCH}"
                RESULT_VARIABLE result OUTPUT_VARIABLE said ERROR_VARIABLE erred)
if(NOT result EQUAL 0)
  message(FATAL_ERROR "ended with ${result}:\n${said}${erred}")
endif()

string(REGEX REPLACE "([][+.*()^$?|\\\\])" "\\\\\\1" pattern "${wanted}")
string(REGEX REPLACE "(^|\n)\\\\\\.\\\\\\.\\\\\\.\n" "\\1([^\n]*\n)*" pattern "${pattern}")
string(REPLACE "\\.\\.\\." "[^\n]*" pattern "${pattern}")
if(NOT said MATCHES "^${pattern}$")
  message(FATAL_ERROR "printed\n${said}instead of\n${wanted}")
endif()
message(STATUS "prints what the page says:\n${said}")
