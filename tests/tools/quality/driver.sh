# SPDX-License-Identifier: Apache-2.0
# The driver among programs that do what the case asks: what it repeats, refuses, and reports.
source "$(dirname "$0")/support.sh"

# Words are the seed's digits; "dieharder" tells a p-value by the case and the seed.
bin=$scratch/bin
mkdir "$bin"
cat >"$bin/quality_words" <<'TEXT'
#!/bin/sh
[ "$1" = --list ] && printf 'good single both\ngood skip full\nbad single both\n' && exit
echo "$3"
[ "$1" = good ] || [ -z "$broken" ]
TEXT
cat >"$bin/quality_tests" <<'TEXT'
#!/bin/sh
cat >/dev/null
echo "$1 0.5"
TEXT
cat >"$bin/dieharder" <<'TEXT'
#!/bin/sh
[ "$1" = -l ] && echo '# dieharder version 3.0 #' && exit
read -r seed
case "$case $seed" in
  "fails "* | "weak 1000" | "weak 1002" | "wrong 1000" | "wrong 1002" | "wrong 1003") p=$small ;;
  silent*) exit 1 ;;
  *) p=0.40000000 ;;
esac
echo "  some_test,   0,  100,     100,$p,  WHATEVER"
TEXT
chmod +x "$bin"/*
echo "both dieharder -d 0" >"$scratch/tests"

# drive CASE OPTION...: what the driver prints, its standard error behind it, and the status. It
# finds its own files in a copy, so that a page it should not write shows.
cp -r "$driver" "$scratch/tools"
rm -f "$scratch/tools/results.txt"
drive() {
  case=$1 small=${small:-0.00100000} broken=${broken:-} PATH="$bin:$PATH" TARN_TESTU01=no_such_program \
    bash "$scratch/tools/quality.sh" "$bin" --tests "$scratch/tests" "${@:2}" 2>&1 |
    sed '/^[0-9:]* [a-z]* [a-z]*$/d'
  echo "status ${PIPESTATUS[0]}"
}
export case small broken
head='| Engine | Layout | Values | Failed | Weak | Judgement |
|---|---|---|---|---|---|'

expect "all passed" "$(drive passes good)" "$head
| \`good\` | \`single\` | 1 | 0 | 0 | passed |
status 0"
expect "weak once more of three" "$(drive weak good)" "$head
| \`good\` | \`single\` | 1 | 0 | 1 | passed |
status 0"
expect "weak twice more" "$(drive wrong good)" "$head
| \`good\` | \`single\` | 1 | 1 | 0 | **FAILED** |
status 1"
expect "failed at once" "$(small=0.00000001 drive fails good)" "$head
| \`good\` | \`single\` | 1 | 1 | 0 | **FAILED** |
status 1"
expect "all layouts" "$(drive passes --full good)" "$head
| \`good\` | \`single\` | 1 | 0 | 0 | passed |
| \`good\` | \`skip\` | 1 | 0 | 0 | passed |
status 0"
printf 'full dieharder -d 0\nshort own some_test\nboth own other_test\n' >"$scratch/tests"
expect "tests of the short run" "$(drive fails good)" "$head
| \`good\` | \`single\` | 2 | 0 | 0 | passed |
status 0"
expect "tests of the full run" "$(drive fails --full good | tail -n 3)" \
"| \`good\` | \`single\` | 2 | 1 | 0 | **FAILED** |
| \`good\` | \`skip\` | 2 | 1 | 0 | **FAILED** |
status 1"
echo "both dieharder -d 0" >"$scratch/tests"
expect_part "another seed" "$(drive wrong --seed 2000 good)" "| passed |"

expect_part "a silent program" "$(drive silent good)" "dieharder -d 0 gave no result for good single 1000"
expect_part "its status" "$(drive silent good)" "status 1"
expect_part "words that break off" "$(broken=1 drive passes bad)" "gave no result for bad single 1000"
expect_part "no such engine" "$(drive passes best)" "no layout of an engine best"
expect_part "no such option" "$(drive passes --best)" "usage: ./run quality"
expect_part "no such tests" "$(drive passes --tests "$scratch/none" good)" "cannot read $scratch/none"
expect_part "no such seed" "$(drive passes --seed 1x good)" "--seed takes a number"
echo "both shuffler -d 0" >"$scratch/tests"
expect_part "no such program" "$(drive passes good)" "no test program is called shuffler"
[ -e "$scratch/tools/results.txt" ] || [ -e "$scratch/docs" ]
expect "no page of one engine" $? 1

# Without dieharder there is nothing to judge with; the other programs are for those who have them.
cat >"$scratch/tests" <<'TEXT'
both own some_test
both practrand -tlmax 1MB
both testu01 SmallCrush
TEXT
expect "other programs are missing" "$(drive passes good)" "$head
| \`good\` | \`single\` | 1 | 0 | 0 | passed |
status 0"
mkdir "$scratch/few"
for program in bash sed grep dirname readlink; do ln -s "$(command -v $program)" "$scratch/few"; done
expect_part "dieharder is missing" \
  "$(PATH=$scratch/few bash "$driver/quality.sh" "$bin" good 2>&1)" "dieharder is missing"

# All engines: results with their head, and the page.
echo "both dieharder -d 0" >"$scratch/tests"
mkdir "$scratch/docs"
mv "$scratch/tools" "$scratch/quality"
mkdir "$scratch/tools"
mv "$scratch/quality" "$scratch/tools/quality"
case=weak small=0.00100000 broken="" PATH="$bin:$PATH" \
  bash "$scratch/tools/quality/quality.sh" "$bin" --tests "$scratch/tests" >/dev/null 2>&1
results=$scratch/tools/quality/results.txt
expect "all results" "$(grep -v '^#' "$results" | tr '\t' ' ')" \
  'good single dieharder some_test:0 1000 0.00100000
good single dieharder some_test:0 1001 0.40000000
good single dieharder some_test:0 1002 0.00100000
good single dieharder some_test:0 1003 0.40000000
bad single dieharder some_test:0 1000 0.00100000
bad single dieharder some_test:0 1001 0.40000000
bad single dieharder some_test:0 1002 0.00100000
bad single dieharder some_test:0 1003 0.40000000'
expect_part "the program's version" "$(cat "$results")" "# dieharder: 3.0"
expect_part "the page" "$(cat "$scratch/docs/quality.md")" \
  "| \`good\` | \`single\` | \`some_test:0\` | 0.001 | 0.4, 0.001, 0.4 | weak |"
finish 22
