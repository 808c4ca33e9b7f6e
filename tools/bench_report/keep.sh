#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# keep.sh FOLDER DOCS: puts the tables of a report (report.sh) into DOCS/performance.md, each between
# the lines "<!-- bench: <program>.<table> -->" and "<!-- end -->", and their figures into
# DOCS/performance. What the report has not stays as it is. DOCS/speed.svg is the figure of
# bench_speed.
set -euo pipefail

fail() {
  echo "bench_report: $*" >&2
  exit 1
}

[ $# -eq 2 ] || fail "usage: keep.sh FOLDER DOCS"
folder=$1
docs=$2
page=$docs/performance.md
[ -f "$page" ] || fail "$page is missing"

awk -v folder="$folder" '
  function table(name,    file, line, found) {
    file = folder "/" name ".md"
    while ((getline line < file) > 0) {
      sub(/\]\(bench_/, "](performance/bench_", line)
      print (found++ ? "" : "\n") line
    }
    close(file)
    if (found) print ""
    return found
  }
  /^<!-- bench: [a-z0-9_.]+ -->$/ {
    if (inside) exit 1
    print
    inside = 1
    made = table($3)
    next
  }
  /^<!-- end -->$/ && inside { inside = made = 0 }
  !made { print }
  END { exit inside }' "$page" >"$page.new" ||
  { rm -f "$page.new"; fail "$page: a table without its end"; }
mv "$page.new" "$page"

mkdir -p "$docs/performance"
for figure in $(sed -n 's/^<!-- bench: \([a-z0-9_.]*\) -->$/\1/p' "$page"); do
  [ ! -f "$folder/$figure.svg" ] || cp "$folder/$figure.svg" "$docs/performance"
done
[ ! -f "$folder/bench_speed.figures.svg" ] || cp "$folder/bench_speed.figures.svg" "$docs/speed.svg"
