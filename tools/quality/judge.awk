# SPDX-License-Identifier: Apache-2.0
# Judges the values of a run and prints one part of the page about them:
#   awk -v part=<which> -f bounds.awk -f judge.awk known.txt results.txt
# part: head, summary, failures, weak, unseen; or status, which prints nothing, and gives the status 1
# if something fails for no known reason.

BEGIN { FS = "\t" }

# known.txt: engine, layout or *, expression of tests or -, reason.
FILENAME ~ /known\.txt$/ {
  if (/^#/ || NF < 4) next
  known++
  known_engine[known] = $1
  known_layout[known] = $2
  known_tests[known] = $3
  known_reason[known] = $4
  next
}

/^# [A-Za-z0-9]+: / {
  row = "| " substr($0, 3) " |"
  sub(/: /, " | ", row)
  head = head row "\n"
}
/^#/ { next }

# engine, layout, program, test, seed, value: the first line of a test is its value, further ones are
# repetitions of a weak one.
{
  run = $1 FS $2
  if (!(run in number)) {
    number[run] = ++runs
    run_of[runs] = run
    engines[$1] = 1
  }
  key = run FS $3 FS $4
  if (!(key in first)) {
    tests[run]++
    test_of[run, tests[run]] = key
    first[key] = $6
  } else {
    again[key] = again[key] (again[key] == "" ? "" : ", ") shown($6)
  }
  if (verdict($6) == "failed") failed[key] = 1
  if (verdict($6) == "weak") weak[key]++
}

function shown(value) {
  if (value ~ /^[a-z]/) return value
  if (value > 0.9999 && value < 1) return sprintf("1 - %.2g", 1 - value)
  return sprintf("%.4g", value)
}

# Two weak repetitions of three are a failure: by chance one weak value in 3000 ends so.
function result(key) {
  if (key in failed || weak[key] > 2) return "failed"
  return weak[key] == 2 ? "weak" : "passed"
}

# The number of the reason why a test may fail, 0 if none is known.
function reason(run, test,    i, of) {
  split(run, of, FS)
  for (i = 1; i <= known; i++)
    if (known_engine[i] == of[1] && (known_layout[i] == "*" || known_layout[i] == of[2]) &&
        known_tests[i] != "-" && test ~ ("^(" known_tests[i] ")")) return i
  return 0
}

function test_name(key,    of) {
  split(key, of, FS)
  return of[4]
}

function cells(run,    of) {
  split(run, of, FS)
  return "| `" of[1] "` | `" of[2] "` | "
}

function code(name) { return "`" name "`" }

# Fills fails[run], weaks[run] and unexplained, and the tests of each run that fail for each reason.
function judge(    i, j, run, key, why) {
  for (i = 1; i <= runs; i++) {
    run = run_of[i]
    for (j = 1; j <= tests[run]; j++) {
      key = test_of[run, j]
      if (result(key) == "weak") weaks[run]++
      if (result(key) != "failed") continue
      fails[run]++
      why = reason(run, test_name(key))
      seen[why] = 1
      if (!why) unexplained++
      failing[run, why] = failing[run, why] (failing[run, why] == "" ? "" : ", ") \
        code(test_name(key)) " " shown(first[key]) (again[key] == "" ? "" : " (" again[key] ")")
    }
  }
}

function summary(    i, run, said) {
  print "| Engine | Layout | Values | Failed | Weak | Judgement |"
  print "|---|---|---|---|---|---|"
  for (i = 1; i <= runs; i++) {
    run = run_of[i]
    said = "passed"
    if (fails[run]) said = "**FAILED**"
    if (fails[run] && !((run, 0) in failing)) said = said ", for known reasons"
    print cells(run) tests[run] " | " fails[run] + 0 " | " weaks[run] + 0 " | " said " |"
  }
}

function failures(    i, why, run) {
  if (!runs) return
  print "| Engine | Layout | Tests with their p-values | Why |"
  print "|---|---|---|---|"
  for (i = 1; i <= runs; i++)
    for (why = 0; why <= known; why++) {
      run = run_of[i]
      if ((run, why) in failing)
        print cells(run) failing[run, why] " | " (why ? known_reason[why] : "**not explained**") " |"
    }
}

function repeated(    i, j, run, key) {
  print "| Engine | Layout | Test | p | With other seeds | Judgement |"
  print "|---|---|---|---|---|---|"
  for (i = 1; i <= runs; i++) {
    run = run_of[i]
    for (j = 1; j <= tests[run]; j++) {
      key = test_of[run, j]
      if (again[key] != "")
        print cells(run) code(test_name(key)) " | " shown(first[key]) " | " again[key] " | " \
          result(key) " |"
    }
  }
}

function unseen(    i) {
  for (i = 1; i <= known; i++)
    if (!(i in seen) && known_engine[i] in engines)
      print "- `" known_engine[i] "`" (known_layout[i] == "*" ? "" : ", `" known_layout[i] "`") ": " \
        known_reason[i]
}

END {
  judge()
  if (part == "head") printf "| Of this run | |\n|---|---|\n%s", head
  if (part == "summary") summary()
  if (part == "failures") failures()
  if (part == "weak") repeated()
  if (part == "unseen") unseen()
  if (part == "status") exit unexplained > 0 || !runs
}
