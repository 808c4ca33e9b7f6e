# SPDX-License-Identifier: Apache-2.0
# Counts what a test run proved: awk -v cases=<folder> -f tally.awk <CTest's JUnit file>
# A GoogleTest program counts case by case, from <folder>/<test>.xml. Any other test counts once,
# and so does a program that left no whole file, or that failed though all its cases passed.
# Prints the failed and the skipped with the reasons; the last line is
# "N passed, N failed, N skipped". The status is not 0 if anything failed or nothing ran.
# Plain POSIX awk, line by line: CTest and GoogleTest write one element a line.

function text(s) {  # the characters behind XML's escapes, on one line
  gsub(/&#x0A;|&#10;/, " ", s)
  gsub(/&quot;/, "\"", s)
  gsub(/&apos;/, "'", s)
  gsub(/&lt;/, "<", s)
  gsub(/&gt;/, ">", s)
  gsub(/&amp;/, "\\&", s)
  return s
}

function attribute(line, name,    at) {
  at = index(line, " " name "=\"")
  if (!at) return ""
  line = substr(line, at + length(name) + 3)
  return text(substr(line, 1, index(line, "\"") - 1))
}

function add_failed(what) { failed++; failures = failures "  " what "\n" }
function add_skipped(what, why) { skipped++; skips = skips "  " what ": " why "\n" }

# Reads one GoogleTest file into case_count and its lists; 1 if the file is there and whole.
function read_cases(file,    line, whole, inside, tag) {
  case_count = 0
  inside = ""
  whole = 0
  while ((getline line < file) > 0) {
    if (inside != "") {  # free text of a message, which may look like anything
      if (index(line, "]]></" inside ">")) inside = ""
      continue
    }
    if (line ~ /^ *<testcase /) {
      case_count++
      case_name[case_count] = attribute(line, "classname") "." attribute(line, "name")
      case_state[case_count] = attribute(line, "status") == "notrun" ? "skipped" : "passed"
      case_why[case_count] = "disabled"
    } else if (line ~ /^ *<(failure|skipped)[ >]/) {
      tag = line ~ /^ *<failure/ ? "failure" : "skipped"
      if (tag == "failure") {
        case_state[case_count] = "failed"
      } else if (case_state[case_count] != "failed") {
        case_state[case_count] = "skipped"
        case_why[case_count] = reason(attribute(line, "message"))
      }
      if (!index(line, "]]></" tag ">") && line !~ /\/> *$/) inside = tag
    } else if (line ~ /<\/testsuites>/) {
      whole = 1
    }
  }
  close(file)
  return whole
}

function reason(message) {  # GoogleTest puts "file:line" before the reason
  sub(/^[^ ]*:[0-9]+ */, "", message)
  gsub(/^ +| +$/, "", message)
  return message == "" ? "no reason given" : message
}

# One test of CTest, complete: its name, its status and what it said first.
function count_test(    i, bad) {
  if (name == "") return
  if (read_cases(cases "/" name ".xml")) {
    bad = 0
    for (i = 1; i <= case_count; i++) {
      if (case_state[i] == "passed") {
        passed++
      } else if (case_state[i] == "skipped") {
        add_skipped(name " " case_name[i], case_why[i])
      } else {
        bad++
        add_failed(name " " case_name[i])
      }
    }
    if (status != "run" && !bad) add_failed(name ": the program failed, though no case did")
  } else if (status == "run") {
    passed++
  } else if (status == "disabled" || skip_rule ~ /^SKIP_/) {
    add_skipped(name, said == "" ? status : said)
  } else {
    add_failed(name (skip_rule == "" ? "" : ": " skip_rule))
  }
}

/^[ \t]*<testcase / {
  count_test()
  name = attribute($0, "name")
  status = attribute($0, "status")
  skip_rule = said = ""
  next
}
/^[ \t]*<skipped / { skip_rule = attribute($0, "message"); next }
/^[ \t]*<system-out>/ { in_output = 1 }
in_output {
  line = $0
  gsub(/<\/?system-out>/, "", line)
  gsub(/^[ \t]+|[ \t]+$/, "", line)
  if (said == "" && line != "") said = text(line)
  if (/<\/system-out>/) in_output = 0
}

END {
  count_test()
  if (failures != "") printf "\nFailed:\n%s", failures
  if (skips != "") printf "\nSkipped:\n%s", skips
  if (passed + failed == 0) printf "\nNo test ran.\n"
  printf "\n%d passed, %d failed, %d skipped\n", passed, failed, skipped
  exit failed > 0 || passed + failed == 0
}
