# SPDX-License-Identifier: Apache-2.0
# Turns what a test program printed into lines "test<TAB>value<TAB>verdict":
#   awk -v tool=<which> -f bounds.awk -f parse.awk
# A value is a p-value, or passed, weak or failed where the program gives no p-value. The status is
# 1 if the text is none of that program, or was cut off: nothing may count as passed by silence.

function line(test, value) {
  gsub(/[ \t,]+/, "_", test)
  rows++
  print test "\t" value "\t" verdict(value)
}

function is_number(text) { return text ~ /^[0-9]*\.?[0-9]+([eE][-+]?[0-9]+)?$/ }

BEGIN { FS = tool == "dieharder" ? " *, *" : " " }

tool == "own" && NF == 2 && is_number($2) { line($1, $2) }

# name, ntuple, tsamples, psamples, p-value, assessment. Tests with several p-values have a line each.
tool == "dieharder" && NF >= 6 && is_number($5) {
  sub(/^ +/, "", $1)
  name = $1 ":" $2
  seen[name]++
  line(name (seen[name] > 1 ? "/" seen[name] : ""), $5)
}

# A block for each length; the last block is the longest and holds the judgement.
tool == "practrand" && /^length=/ { delete found; whole = 0 }
tool == "practrand" && /^ +no anomalies in/ { whole = 1 }
tool == "practrand" && /^ +\.\.\.and [0-9]+ test result/ { whole = 1 }
tool == "practrand" && /FAIL|SUSPICIOUS|suspicious/ && /R=/ {
  found[$1] = /FAIL/ ? "failed" : "weak"
  whole = 1
}
tool == "practrand" && /unusual/ && /R=/ { whole = 1 }  # its manual: to be seen now and then

# The summary lists the suspicious tests with number, name and p-value.
tool == "testu01" && /^ *All (other )?tests were passed/ { whole = 1 }
tool == "testu01" && /Summary results of/ { summary = 1 }
tool == "testu01" && summary && $1 ~ /^[0-9]+$/ && NF >= 3 {
  value = $NF
  above = $(NF - 1) == "-" && $(NF - 2) == "1"
  if (value == "eps") value = 0
  if (value == "eps1") value = 0
  if (is_number(value)) {
    name = $2
    for (i = 3; i <= NF - (above ? 3 : 1); i++) name = name " " $i
    line(name, above ? sprintf("%.17g", 1 - value) : value)
  }
}

END {
  if (tool == "practrand") {
    if (!whole) exit 1
    for (name in found) line(name, found[name])
  }
  if (tool == "testu01" && !whole) exit 1
  if (tool == "practrand" || tool == "testu01") {
    if (!rows) line("all", "passed")
    exit 0
  }
  exit rows == 0
}
