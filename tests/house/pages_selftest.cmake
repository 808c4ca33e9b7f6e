# SPDX-License-Identifier: Apache-2.0
# Sees that check_pages.cmake finds a page that is missing, one too many, and what pages can lack.
#   cmake -DROOT=<tree> -DCHECK=<check_pages.cmake> -DFIXTURE=<scratch folder> -P pages_selftest.cmake
cmake_minimum_required(VERSION 3.25)

# check(TEXT): fails unless the check of the fixture says that; with no text, unless it passes.
function(check text)
  execute_process(COMMAND "${CMAKE_COMMAND}" -DROOT=${FIXTURE} -P "${CHECK}"
                  RESULT_VARIABLE result OUTPUT_QUIET ERROR_VARIABLE said)
  string(REGEX REPLACE "[ \n]+" " " said "${said}")
  string(FIND "${said}" "${text}" at)
  if((text STREQUAL "" AND NOT result EQUAL 0) OR (text AND result EQUAL 0) OR at EQUAL -1)
    message(SEND_ERROR "not \"${text}\", but ${result}: ${said}")
  endif()
endfunction()

# Two rows, and pages with all that is asked.
function(fresh)
  file(REMOVE_RECURSE "${FIXTURE}")
  file(WRITE "${FIXTURE}/rng/engines/engines.def" "// a list\nTARN_ENGINE(wheel, 1)\n")
  file(WRITE "${FIXTURE}/rng/distributions/distributions.def"
       "TARN_DISTRIBUTION(flat, float)\nTARN_DISTRIBUTION(flat, double)\n")
  file(WRITE "${FIXTURE}/docs/engines/README.md" "# Engines\n")
  file(WRITE "${FIXTURE}/docs/engines/wheel.md" "# wheel\n\n**Recurrence.** x\n\n**Period.** 1\n
**Word.** x\n\n**Reals.** x\n\n**Seeding.** x\n\n**Skips, leapfrog.** x\n\n**Good for** x
**Known to fail:** x\n\n![Pairs](wheel.svg)\n![More pairs](wheel_40.svg)\n")
  file(WRITE "${FIXTURE}/docs/distributions/flat.md" "# flat\n\n**Law.** x\n\n**C.** x\n
**C++.** x\n\n**Words and methods:** x\n\n**Accuracy.** x\n\n**Edges.** x\n\n![Law](flat.svg)\n")
  file(WRITE "${FIXTURE}/docs/engines/wheel.svg" "<svg/>")
  file(WRITE "${FIXTURE}/docs/engines/wheel_40.svg" "<svg/>")
  file(WRITE "${FIXTURE}/docs/distributions/flat.svg" "<svg/>")
endfunction()

# change(FILE FROM TO): in a fresh fixture.
function(change file from to)
  fresh()
  file(READ "${FIXTURE}/${file}" text)
  string(REPLACE "${from}" "${to}" text "${text}")
  file(WRITE "${FIXTURE}/${file}" "${text}")
endfunction()

fresh()
check("")
foreach(part "Recurrence." "Period." "Word." "Reals." "Seeding." "Skips" "Good for" "Known to fail:")
  change(docs/engines/wheel.md "**${part}" "**Else")
  check("docs/engines/wheel.md: no paragraph **")
endforeach()
foreach(part "Law." "C." "C++." "Words and methods" "Accuracy." "Edges.")
  change(docs/distributions/flat.md "**${part}" "**Else")
  check("docs/distributions/flat.md: no paragraph **")
endforeach()
change(docs/engines/wheel.md "# wheel" "# hub")
check("docs/engines/wheel.md: its title is another one")
change(docs/distributions/flat.md "flat.svg" "round.svg")
check("docs/distributions/flat.md: no figure flat.svg")
fresh()
file(REMOVE "${FIXTURE}/docs/engines/wheel_40.svg")
check("there is no wheel_40.svg")
fresh()
file(REMOVE "${FIXTURE}/docs/distributions/flat.md")
check("there is no docs/distributions/flat.md")
fresh()
file(WRITE "${FIXTURE}/docs/engines/axle.md" "# axle\n")
check("docs/engines/axle.md: no row has this name")
fresh()
file(WRITE "${FIXTURE}/rng/engines/engines.def" "// no row\n")
check("nothing was checked")
