# SPDX-License-Identifier: Apache-2.0
# What the driver reads out of the texts of test programs.
source "$(dirname "$0")/support.sh"

# parse TOOL < TEXT: its lines, test, value and verdict, with blanks for tabs, and the status.
parse() {
  awk -v tool="$1" -f "$driver/bounds.awk" -f "$driver/parse.awk" | sort | tr '\t' ' '
  echo "status ${PIPESTATUS[0]}"
}

expect "p-values of dieharder" "$(parse dieharder <<'TEXT'
#=============================================================================#
   diehard_birthdays,   0,       100,     100,0.96843582,  PASSED
        diehard_runs,   0,    100000,     100,0.00412000,   WEAK
        diehard_runs,   0,    100000,     100,0.99999999,  FAILED
    rgb_permutations,   5,    100000,     100,0.00000000,  FAILED
TEXT
)" 'diehard_birthdays:0 0.96843582 passed
diehard_runs:0 0.00412000 weak
diehard_runs:0/2 0.99999999 failed
rgb_permutations:5 0.00000000 failed
status 0'

expect "the bounds" "$(parse dieharder <<'TEXT'
 a, 0, 1, 1, 0.00500000, PASSED
 b, 0, 1, 1, 0.00499999, PASSED
 c, 0, 1, 1, 0.99500000, PASSED
 d, 0, 1, 1, 0.99500001, PASSED
 e, 0, 1, 1, 0.00000100, PASSED
 f, 0, 1, 1, 0.00000099, PASSED
 g, 0, 1, 1, 0.99999901, PASSED
 h, 0, 1, 1, 0.99999902, PASSED
TEXT
)" 'a:0 0.00500000 passed
b:0 0.00499999 weak
c:0 0.99500000 passed
d:0 0.99500001 weak
e:0 0.00000100 weak
f:0 0.00000099 failed
g:0 0.99999901 failed
h:0 0.99999902 failed
status 0'

for text in "" "Error: something is wrong" "   diehard_birthdays,   0,       100,     100,nan,  PASSED"; do
  expect "no result of dieharder" "$(parse dieharder <<<"$text")" "status 1"
done

expect "a test of our own" "$(parse own <<<'birthday_spacings 1.00000000e+00')" \
  'birthday_spacings 1.00000000e+00 failed
status 0'
expect "no result of our own" "$(parse own <<<'')" "status 1"

expect "PractRand without anomalies" "$(parse practrand <<'TEXT'
RNG_test using PractRand version 0.95
RNG = RNG_stdin32, seed = unknown
test set = core, folding = standard (32 bit)

rng=RNG_stdin32, seed=unknown
length= 64 megabytes (2^26 bytes), time= 2.3 seconds
  no anomalies in 148 test result(s)
TEXT
)" 'all passed passed
status 0'

expect "PractRand with anomalies" "$(parse practrand <<'TEXT'
length= 32 megabytes (2^25 bytes), time= 1.1 seconds
  Test Name                         Raw       Processed     Evaluation
  Gap-16:A                          R= +99.9  p =  1e-30    FAIL
  ...and 130 test result(s) without anomalies

length= 64 megabytes (2^26 bytes), time= 2.3 seconds
  Test Name                         Raw       Processed     Evaluation
  [Low1/32]BRank(12):256(1)         R= +1272  p~=  5.4e-384   FAIL !!!!!!!
  DC6-9x1Bytes-1                    R=  +6.9  p =  1.2e-3   unusual
  FPF-14+6/16:all                   R=  +8.9  p =  3.2e-7   suspicious
  Gap-16:B                          R=  +9.9  p =  3.2e-9   VERY SUSPICIOUS
  ...and 144 test result(s) without anomalies
TEXT
)" 'FPF-14+6/16:all weak weak
Gap-16:B weak weak
[Low1/32]BRank(12):256(1) failed failed
status 0'

expect "PractRand that was cut off" "$(parse practrand <<'TEXT'
length= 32 megabytes (2^25 bytes), time= 1.1 seconds
  no anomalies in 130 test result(s)
length= 64 megabytes (2^26 bytes), time= 2.3 seconds
TEXT
)" "status 1"

expect "TestU01 without anomalies" "$(parse testu01 <<'TEXT'
========= Summary results of SmallCrush =========

 Version:          TestU01 1.2.3
 Number of statistics:  15

 All tests were passed
TEXT
)" 'all passed passed
status 0'

expect "TestU01 with anomalies" "$(parse testu01 <<'TEXT'
========= Summary results of SmallCrush =========

 Number of statistics:  15
 Total CPU time:   00:00:08.12
 The following tests gave p-values outside [0.001, 0.9990]:
 (eps  means a value < 1.0e-300):
 (eps1 means a value < 1.0e-15):

       Test                          p-value
 ----------------------------------------------
  1  BirthdaySpacings                 eps
  3  Gap, r = 0                      4.5e-4
  6  MaxOft AD                      1 - eps1
  9  HammingIndep, L = 30           1 -  9.0e-4
 ----------------------------------------------
 All other tests were passed
TEXT
)" 'BirthdaySpacings 0 failed
Gap_r_=_0 4.5e-4 weak
HammingIndep_L_=_30 0.99909999999999999 weak
MaxOft_AD 1 failed
status 0'

expect "TestU01 without a summary" "$(parse testu01 <<<'Starting SmallCrush')" "status 1"
finish 13
