// SPDX-License-Identifier: Apache-2.0
#include "birthday_spacings.hpp"

#include <algorithm>
#include <cmath>
#include <numeric>

namespace tarn::quality {

std::size_t equal_spacings(std::vector<std::uint64_t> points) {
  std::sort(points.begin(), points.end());
  std::adjacent_difference(points.begin(), points.end(), points.begin());
  if (!points.empty())
    points.erase(points.begin());  // the first point, which is no difference
  std::sort(points.begin(), points.end());
  const auto distinct = std::unique(points.begin(), points.end());
  return static_cast<std::size_t>(points.end() - distinct);
}

double expected_equal_spacings(std::size_t n) {
  const auto count = static_cast<double>(n);
  return std::ldexp(count * count * count, -66);
}

double poisson_chance(std::size_t count, double mean) {
  double below = 0;
  double equal = std::exp(-mean);
  for (std::size_t i = 0; i < count && equal > 0; ++i) {
    below += equal;
    equal *= mean / static_cast<double>(i + 1);
  }
  return std::min(1.0, below + equal / 2);
}

}  // namespace tarn::quality
