# SPDX-License-Identifier: Apache-2.0
# What a value means. A p-value of a good generator is uniform on [0, 1], and both of its ends are
# wrong: results that are too regular are no better than those that are too rare.
# Failed: an end of less than 1e-6. The 420 values of a short run of good engines hold one in 1200 runs.
# Weak: less than 0.005, which one value in a hundred is by chance. (dieharder has the same bounds.)

function tail(p) { return p < 0.5 ? p + 0 : 1 - p }

function verdict(value) {
  if (value ~ /^(passed|weak|failed)$/) return value
  return tail(value) < 1e-6 ? "failed" : tail(value) < 0.005 ? "weak" : "passed"
}
