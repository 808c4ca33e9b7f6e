#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# report.sh FILE.json FOLDER [MACHINE]: makes of a benchmark program's JSON, for each of its tables,
# FOLDER/<program>.<table>.md with the figure FOLDER/<program>.<table>.svg, and FOLDER/<program>.md
# with all of them. MACHINE says what it was measured on; without it, this machine's processor.
set -euo pipefail
here=$(dirname "$(readlink -f "${BASH_SOURCE[0]}")")

fail() {
  echo "bench_report: $*" >&2
  exit 1
}

[ $# -ge 2 ] || fail "usage: report.sh FILE.json FOLDER [MACHINE]"
json=$1
folder=$2
machine=${3:-$(sed -n '0,/^model name/s/^model name[^:]*: *//p' /proc/cpuinfo)}
program=$(basename "$json" .json)

# show WHAT [TABLE]
show() {
  jq -r --arg show "$1" --arg table "${2:-}" --arg machine "$machine" -f "$here/report.jq" "$json"
}

names=$(show names) || fail "cannot read $json"
[ -n "$names" ] || fail "$json has no figures"
origin=$(show origin)
columns=$(mktemp)
trap 'rm -f "$columns"' EXIT

printf '# %s\n\n%s\n' "$program" "$origin" >"$folder/$program.md"
while read -r table; do
  name=$program.$table
  show markdown "$table" >"$folder/$name.md"
  show bars "$table" >"$columns"
  if [ "$(wc -l <"$columns")" -gt 1 ]; then  # times alone have no bars
    gnuplot -c "$here/bars.gnuplot" "$columns" "$folder/$name.svg" || fail "gnuplot failed on $name"
    printf '\n![%s of %s](%s.svg)\n' "$table" "$program" "$name" >>"$folder/$name.md"
  fi
  { printf '\n## %s\n\n' "$table" && cat "$folder/$name.md"; } >>"$folder/$program.md"
  printf '\n%s\n' "$origin" >>"$folder/$name.md"
done <<<"$names"
