// SPDX-License-Identifier: Apache-2.0
// Distance of a result from a reference of higher precision, and spread arguments for sweeps.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <vector>

namespace lumen_test {

// |got - want| in units of the spacing of T around `want`; infinite if only one is NaN or if one
// is infinite and the other is not what it would round to.
template <typename T>
double ulps(T got, long double want) {
  if (std::isnan(want) || std::isnan(got)) {
    return std::isnan(want) && std::isnan(got) ? 0.0 : std::numeric_limits<double>::infinity();
  }
  if (std::isinf(got) || std::isinf(static_cast<T>(want))) {
    return got == static_cast<T>(want) ? 0.0 : std::numeric_limits<double>::infinity();
  }
  const int least = std::numeric_limits<T>::min_exponent - 1;
  const int exponent = want == 0 ? least : std::max(std::ilogb(want), least);
  const long double spacing = std::ldexp(1.0L, exponent - std::numeric_limits<T>::digits + 1);
  return static_cast<double>(std::fabs(static_cast<long double>(got) - want) / spacing);
}

// `count` arguments from `lowest` to `highest`: half evenly spread, half spread over the
// magnitudes down to 1e-6 of the ends, at irregular places.
template <typename T>
std::vector<T> spread(double lowest, double highest, int count = 4000) {
  std::vector<T> points;
  std::uint64_t state = 12345;
  for (int i = 0; i < count; ++i) {
    state = state * 6364136223846793005U + 1442695040888963407U;
    const double u = static_cast<double>(state >> 11) * 0x1p-53;
    const double flat = lowest + u * (highest - lowest);
    const double end = i % 4 < 2 ? lowest : highest;
    const double near_zero = end * std::pow(10.0, -6 * u);
    const double point = i % 2 == 0 || near_zero < lowest || near_zero > highest ? flat : near_zero;
    points.push_back(static_cast<T>(point));
  }
  return points;
}

}  // namespace lumen_test
