# SPDX-License-Identifier: Apache-2.0
# Sees that transcript.cmake finds programs that fail and that print something else.
#   cmake -DCHECK=<transcript.cmake> -DFIXTURE=<folder> -P transcript_selftest.cmake
cmake_minimum_required(VERSION 3.25)
set(fence "```")

# expect(MEANING OUTCOME COMMANDS TEXT): the section with these two is judged so: 0 right, 1 wrong.
function(expect meaning outcome commands text)
  file(WRITE "${FIXTURE}/README.md" "# Page\n\n## before\n\n${fence}sh\ntrue\n${fence}\n\n${fence}text\n${fence}\n"
    "\n## it\n\nWords.\n\n${fence}sh\n${commands}\n${fence}\n\nMore.\n\n${fence}text\n${text}${fence}\n"
    "\n## behind\n\nWords.\n")
  execute_process(COMMAND "${CMAKE_COMMAND}" "-DREADME=${FIXTURE}/README.md" -DSECTION=${section}
                          "-DEXAMPLES=${FIXTURE}/from" "-DPROGRAMS=${FIXTURE}/from"
                          "-DSCRATCH=${FIXTURE}/run" -P "${CHECK}"
                  RESULT_VARIABLE result OUTPUT_VARIABLE said ERROR_VARIABLE said)
  if((outcome AND NOT result) OR (result AND NOT outcome))
    message(SEND_ERROR "${meaning}: judged ${result} instead of ${outcome}:\n${said}")
  endif()
endfunction()

file(MAKE_DIRECTORY "${FIXTURE}/from")
file(WRITE "${FIXTURE}/from/three.txt" "one\ntwo (2.5)\nthree\n")
set(section it)
set(three "cat examples/three.txt")
expect("equal" 0 "${three}" "one\ntwo (2.5)\nthree\n")
expect("another program folder" 0 "cat build/release/bin/three.txt" "one\ntwo (2.5)\nthree\n")
expect("two commands" 0 "echo zero\n${three}" "zero\none\ntwo (2.5)\nthree\n")
expect("anything in a line" 0 "${three}" "one\ntwo (...)\nthree\n")
expect("any lines" 0 "${three}" "one\n...\n")
expect("no lines" 0 "${three}" "...\none\n...\ntwo (2.5)\nthree\n")
expect("another line" 1 "${three}" "one\ntwo (2.6)\nthree\n")
expect("a point is a point" 1 "${three}" "one\ntwo (2x5)\nthree\n")
expect("a line less" 1 "${three}" "one\ntwo (2.5)\nthree\nfour\n")
expect("a line more" 1 "${three}" "one\ntwo (2.5)\n")
expect("a line in front" 1 "${three}" "two (2.5)\nthree\n")
expect("a failure" 1 "${three}\nfalse" "one\ntwo (2.5)\nthree\n")
expect("a failure before" 1 "false\n${three}" "one\ntwo (2.5)\nthree\n")
set(section elsewhere)
expect("no such section" 1 "${three}" "...\n")
set(section behind)
expect("a section without commands" 1 "${three}" "...\n")
