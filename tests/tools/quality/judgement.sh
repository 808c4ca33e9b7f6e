# SPDX-License-Identifier: Apache-2.0
# What the page says about values: failures with and without a known reason, repetitions, and what is
# known and was not seen.
source "$(dirname "$0")/support.sh"

{
  printf '# a comment\n'
  printf 'lattice\t*\tspac\tIts points lie on a lattice.\n'
  printf 'lattice\tkey\tranks|runs\tThe keys are alike.\n'
  printf 'register\tsingle\tranks\tIt is linear.\n'
  printf 'lattice\t*\t-\tNo test can see this.\n'
  printf 'absent\t*\tranks\tNobody judged it.\n'
} >"$scratch/known.txt"

# values ENGINE LAYOUT TEST VALUE...: the value of a test and of its repetitions.
values() {
  local value seed=7
  for value in "${@:4}"; do
    printf '%s\t%s\tdieharder\t%s\t%d\t%s\n' "$1" "$2" "$3" $seed "$value"
    seed=$((seed + 1))
  done
}
judge() {
  awk -v part="$1" -f "$driver/bounds.awk" -f "$driver/judge.awk" "$scratch/known.txt" \
    "$scratch/results.txt"
  echo "status $?"
}

{
  printf '# The values of a run.\n# date: 2001-02-03\n# machine: a desk: brown\n# engine\tvalue\n'
  values lattice single spacings 1.0
  values lattice single ranks 0.5
  values lattice key spacings 0.999999999
  values lattice key runs 0.001 0.002 0.003 0.4
  values lattice key runs/2 0.00000001
  values register single ranks 0.25
  values register single runs 0.001 0.002 0.3 0.4
  values register single spacings 0.999 0.3 0.2 0.1
} >"$scratch/results.txt"

expect "known failures are in the summary" "$(judge summary)" \
  '| Engine | Layout | Values | Failed | Weak | Judgement |
|---|---|---|---|---|---|
| `lattice` | `single` | 2 | 1 | 0 | **FAILED**, for known reasons |
| `lattice` | `key` | 3 | 3 | 0 | **FAILED**, for known reasons |
| `register` | `single` | 3 | 0 | 1 | passed |
status 0'
expect "failures have their reasons" "$(judge failures)" \
  '| Engine | Layout | Tests with their p-values | Why |
|---|---|---|---|
| `lattice` | `single` | `spacings` 1 | Its points lie on a lattice. |
| `lattice` | `key` | `spacings` 1 - 1e-09 | Its points lie on a lattice. |
| `lattice` | `key` | `runs` 0.001 (0.002, 0.003, 0.4), `runs/2` 1e-08 | The keys are alike. |
status 0'
expect "repetitions" "$(judge weak)" \
  '| Engine | Layout | Test | p | With other seeds | Judgement |
|---|---|---|---|---|---|
| `lattice` | `key` | `runs` | 0.001 | 0.002, 0.003, 0.4 | failed |
| `register` | `single` | `runs` | 0.001 | 0.002, 0.3, 0.4 | weak |
| `register` | `single` | `spacings` | 0.999 | 0.3, 0.2, 0.1 | passed |
status 0'
expect "what was not seen" "$(judge unseen)" \
  '- `register`, `single`: It is linear.
- `lattice`: No test can see this.
status 0'
expect "the head" "$(judge head)" '| Of this run | |
|---|---|
| date | 2001-02-03 |
| machine | a desk: brown |
status 0'
expect "known failures end well" "$(judge status)" "status 0"

values lattice single ranks/2 0.00000001 >>"$scratch/results.txt"
expect "the reason is for another layout" "$(judge failures | grep 'not explained')" \
  '| `lattice` | `single` | `ranks/2` 1e-08 | **not explained** |'
expect_part "known and unknown failures" "$(judge summary)" \
  '| `lattice` | `single` | 3 | 2 | 0 | **FAILED** |'
expect "an unexplained failure" "$(judge status)" "status 1"

# A repetition may fail what was weak; programs without p-values count alike.
{
  values register single runs 0.001 0.00000001 0.3 0.4
  values register seeds all weak weak passed passed
  values register key all weak weak weak passed
  values register skip all failed
} >"$scratch/results.txt"
expect "values without numbers" "$(judge summary | tail -n 5)" \
  '| `register` | `single` | 1 | 1 | 0 | **FAILED** |
| `register` | `seeds` | 1 | 0 | 1 | passed |
| `register` | `key` | 1 | 1 | 0 | **FAILED** |
| `register` | `skip` | 1 | 1 | 0 | **FAILED** |
status 0'
: >"$scratch/results.txt"
expect "nothing is no success" "$(judge status)" "status 1"
finish 11
