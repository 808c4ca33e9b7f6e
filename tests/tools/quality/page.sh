# SPDX-License-Identifier: Apache-2.0
# docs/quality.md is what the checked-in values make, and these are a judged run of all engines.
source "$(dirname "$0")/support.sh"

expect "docs/quality.md is not that of tools/quality/results.txt: tools/quality/page.sh makes it anew" \
  "$(bash "$driver/page.sh")" "$(cat "$driver/../../docs/quality.md")"

# Every sequence of a short run is there, and every engine but the quasi-random ones.
wanted=$("$programs/quality_words" --list | awk '$3 == "both" { print $1, $2 }' | sort)
expect "the runs" "$(awk -F'\t' '!/^#/ { print $1, $2 }' "$driver/results.txt" | sort -u)" "$wanted"

# Values of a test that is twice in a run would pass for repetitions.
twice=$(awk '!/^#/ && NF {
  test = $2
  for (i = 3; i <= NF; i++)
    if ($i == "-p") i++
    else if ($2 == "own" || $2 == "dieharder") test = test " " $i
  if ($1 != "full" && seen["short " test]++) print "short", test
  if ($1 != "short" && seen["full " test]++) print "full", test
}' "$driver/tests.txt")
expect "tests that are twice in a run" "$twice" ""

# A reason without an engine or a layout, or with an expression that says nothing, helps nobody.
list=$("$programs/quality_words" --list)
lost=$(awk -F'\t' '!/^#/ { print $1, $2, NF }' "$driver/known.txt" | while read -r engine layout fields; do
  [ "$layout" = "*" ] && layout=single
  grep -q "^$engine $layout " <<<"$list" && [ "$fields" -eq 4 ] || echo "$engine $layout"
done)
expect "reasons for runs that do not exist" "$lost" ""
finish 4
