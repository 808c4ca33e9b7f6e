// SPDX-License-Identifier: Apache-2.0
// Results of kernel functors against formulas in higher precision: canonical reals to try, and
// distances in units in the last place.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <vector>

#include <gtest/gtest.h>

namespace tarn_test {

/// Spacing of the type's numbers around x.
template <typename R>
long double spacing(long double x) {
  const int least = std::numeric_limits<R>::min_exponent - 1;
  const int exponent = x == 0 ? least : std::max(std::ilogb(x), least);
  return std::ldexp(1.0L, exponent - std::numeric_limits<R>::digits + 1);
}

/// Expects |got - want| <= units * spacing around `scale`.
template <typename R>
void expect_within(R got, long double want, long double units, long double scale) {
  ASSERT_LE(std::fabs(static_cast<long double>(got) - want), units * spacing<R>(scale))
      << got << " instead of " << static_cast<double>(want);
}

/// Reals of (lo, hi), ten thousand as words spread over the range give them and those next to both
/// ends and to the middle.
template <typename R>
std::vector<R> canonical_reals(R lo, R hi) {
  std::vector<R> reals;
  std::uint64_t state = 2024;
  for (int i = 0; i < 10000; ++i) {
    state = state * 6364136223846793005u + 1442695040888963407u;
    const R word = static_cast<R>(static_cast<std::uint32_t>(state >> 32));
    reals.push_back(std::fma(word, (hi - lo) * static_cast<R>(0x1p-32), lo));
  }
  const R middle = (lo + hi) / 2;
  for (int exponent = 1; exponent < 32; ++exponent) {
    const R part = std::ldexp((hi - lo) / 2, -exponent);
    for (const R x : {lo + part, middle - part, middle + part, hi - part}) {
      reals.push_back(x);
    }
  }
  reals.erase(std::remove_if(reals.begin(), reals.end(), [&](R x) { return !(lo < x && x < hi); }),
              reals.end());
  return reals;
}

}  // namespace tarn_test
