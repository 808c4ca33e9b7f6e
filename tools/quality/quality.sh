#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Judges the engines by statistical tests: quality.sh PROGRAMS [OPTION...] [ENGINE...], see usage().
# PROGRAMS is the folder of quality_words and quality_tests. A judged run of all engines leaves its
# values in results.txt, from which page.sh makes docs/quality.md.
set -euo pipefail
here=$(dirname "$(readlink -f "${BASH_SOURCE[0]}")")
export TARN_NUM_THREADS=1  # results do not depend on it, and one core is what a run is to take

usage() {
  cat <<'TEXT'
usage: ./run quality [OPTION...] [ENGINE...]

  --short       the short run (default): a quarter of an hour of one core for all engines
  --full        all tests and layouts: hours, and more than a day with PractRand and TestU01
  --seed N      the first seed (default 1000)
  --tests FILE  these tests instead of those of tools/quality/tests.txt

Without engines all are judged, and docs/quality.md is written; otherwise their judgement is printed.
PractRand (RNG_test) and a TestU01 front end take part where they are on the path. The front end is
named by TARN_TESTU01 (default testu01_stdin): it gets the name of a battery, reads raw 32-bit words
from standard input and prints the battery's summary.
The status is 1 if anything fails that tools/quality/known.txt does not name.
TEXT
}

fail() {
  echo "quality: $*" >&2
  exit 1
}

# words ENGINE LAYOUT SEED: until nobody reads them, which is no failure.
words() { "$programs/quality_words" "$@" || [ $? -eq 141 ]; }

# test_once TOOL ENGINE LAYOUT SEED ARGUMENT...: lines "test<TAB>value<TAB>verdict".
test_once() {
  local tool=$1 from=("${@:2:3}") arguments=("${@:5}") program=()
  case $tool in
    own) program=("$programs/quality_tests") ;;
    dieharder) program=(dieharder -g 200 -c , -D 504) ;;
    practrand) program=(RNG_test stdin32) ;;
    testu01) program=("$testu01") ;;
    *) fail "no test program is called $tool" ;;
  esac
  words "${from[@]}" | "${program[@]}" "${arguments[@]}" |
    awk -v tool="$tool" -f "$here/bounds.awk" -f "$here/parse.awk" ||
    fail "$tool ${arguments[*]} gave no result for ${from[*]}"
}

# Runs a test, and what was weak three times more with other seeds: three is enough to tell chance,
# which repeats a weak one once in a hundred times, from a defect.
test_engine() {
  local tool=$1 engine=$2 layout=$3 first=$4 arguments=("${@:5}") seed said weak test value
  said=$(test_once "$tool" "$engine" "$layout" "$first" "${arguments[@]}")
  while IFS=$'\t' read -r test value _; do
    record "$engine" "$layout" "$tool" "$test" "$first" "$value"
  done <<<"$said"
  weak=$(awk -F'\t' '$3 == "weak" { print $1 }' <<<"$said")
  [ -n "$weak" ] || return 0
  for seed in $((first + 1)) $((first + 2)) $((first + 3)); do
    said=$(test_once "$tool" "$engine" "$layout" "$seed" "${arguments[@]}")
    while read -r test; do
      value=$(awk -F'\t' -v test="$test" '$1 == test { print $2 }' <<<"$said")
      case $tool in
        practrand | testu01) value=${value:-passed} ;;  # these tell what is suspicious alone
      esac
      record "$engine" "$layout" "$tool" "$test" "$seed" "${value:?$tool has no $test any more}"
    done <<<"$weak"
  done
}

record() { (IFS=$'\t'; echo "$*") >>"$out"; }

there() { command -v "$1" >/dev/null; }

# The programs of this run, for the head of the results.
versions() {
  echo "# dieharder: $(dieharder -l | sed -n 's/.*dieharder version \([^ ]*\).*/\1/p')"
  if there RNG_test; then
    echo "# PractRand: $(RNG_test 2>&1 </dev/null | grep -m1 -o 'version [0-9.]*' || echo found)"
  else
    echo "# PractRand: not on the path"
  fi
  if there "$testu01"; then echo "# TestU01: found"; else echo "# TestU01: not on the path"; fi
}

programs=${1:?the folder of the programs}
shift
run=short command="./run quality" base=1000 list=$here/tests.txt engines=()
testu01=${TARN_TESTU01:-testu01_stdin}
[ $# -eq 0 ] || command+=" $*"
while [ $# -gt 0 ]; do
  case $1 in
    --short) run=short ;;
    --full) run=full ;;
    --seed | --tests)
      [ $# -gt 1 ] || { usage >&2; exit 2; }
      if [ "$1" = --seed ]; then base=$2; else list=$2; fi
      shift
      ;;
    --help) usage; exit 0 ;;
    -*) usage >&2; exit 2 ;;
    *) engines+=("$1") ;;
  esac
  shift
done
[[ $base =~ ^[1-9][0-9]{0,7}$ ]] || fail "--seed takes a number from 1 to 99999999, not $base"
[ -r "$list" ] || fail "cannot read $list"
there dieharder || fail "dieharder is missing: apt-get install dieharder"

rows=$("$programs/quality_words" --list)
for engine in "${engines[@]}"; do
  grep -q "^$engine " <<<"$rows" || fail "no layout of an engine $engine"
done
out=$(mktemp)
trap 'rm -f "$out" "$out.times"' EXIT
{
  echo "# The values of the last judged run; docs/quality.md is made from them."
  echo "# date: $(date +%F)"
  echo "# command: $command"
  versions
  echo "# machine: $(sed -n 's/^model name[^:]*: //p' /proc/cpuinfo | head -n1), one core"
  printf '# engine\tlayout\tprogram\ttest\tseed\tvalue\n'
} >"$out"

while read -r engine layout of_run; do
  [[ $of_run == both || $of_run == "$run" ]] || continue
  [ ${#engines[@]} -eq 0 ] || [[ " ${engines[*]} " == *" $engine "* ]] || continue
  echo "$(date +%T) $engine $layout" >&2
  seed=$base
  while read -r test_run tool arguments; do
    [[ $test_run == both || $test_run == "$run" ]] || continue
    case $tool in
      practrand) there RNG_test || continue ;;
      testu01) there "$testu01" || continue ;;
    esac
    read -r -a arguments <<<"$arguments"
    test_engine "$tool" "$engine" "$layout" "$seed" "${arguments[@]}"
    seed=$((seed + 4))  # a test has four seeds of its own
  done < <(sed -e '/^#/d' -e '/^ *$/d' "$list")
done <<<"$rows"
times >"$out.times"  # its second line is about the programs; a pipe would have times of its own
awk 'END { split($1, own, /[ms]/); split($2, kernel, /[ms]/)
           print "# minutes: " int(own[1] + kernel[1] + (own[2] + kernel[2]) / 60 + 1) }' \
  "$out.times" >>"$out"

judge() { awk -v part="$1" -f "$here/bounds.awk" -f "$here/judge.awk" "$here/known.txt" "$out"; }
if [ ${#engines[@]} -eq 0 ]; then
  cp "$out" "$here/results.txt"
  "$here/page.sh" >"$here/../../docs/quality.md"
fi
judge summary
judge status
