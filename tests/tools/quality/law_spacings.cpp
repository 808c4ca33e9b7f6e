// SPDX-License-Identifier: Apache-2.0
// Birthday spacings: the count against a plain one, its mean by experiment, the Poisson law.
#include <algorithm>
#include <cmath>
#include <map>
#include <random>

#include <gtest/gtest.h>

#include "quality/birthday_spacings.hpp"

namespace {

using namespace tarn::quality;
using point_list = std::vector<std::uint64_t>;

point_list random_points(std::size_t n, std::uint64_t mask, std::uint64_t seed) {
  std::mt19937_64 random(seed);
  point_list points(n);
  for (std::uint64_t& point : points)
    point = random() & mask;
  return points;
}

std::size_t plain_count(point_list points) {
  std::sort(points.begin(), points.end());
  std::map<std::uint64_t, std::size_t> spacings;
  for (std::size_t i = 1; i < points.size(); ++i)
    ++spacings[points[i] - points[i - 1]];
  std::size_t equal = 0;
  for (const auto& [spacing, times] : spacings)
    equal += times - 1;
  return equal;
}

TEST(birthday_spacings, of_few_points) {
  EXPECT_EQ(equal_spacings({}), 0u);
  EXPECT_EQ(equal_spacings({7}), 0u);
  EXPECT_EQ(equal_spacings({1, 2, 4}), 0u);
  EXPECT_EQ(equal_spacings({9, 1, 5}), 1u);
  EXPECT_EQ(equal_spacings({3, 3, 3}), 1u);
  // The first point is no spacing, though it is as large as one.
  EXPECT_EQ(equal_spacings({4, 8}), 0u);
  EXPECT_EQ(equal_spacings({0xFFFFFFFFFFFFFFFF, 0, 0x7FFFFFFFFFFFFFFF}), 0u);
}

TEST(birthday_spacings, are_counted_as_by_hand) {
  for (std::uint64_t seed = 1; seed <= 50; ++seed) {
    const point_list points = random_points(100, 0xFFFF, seed);
    EXPECT_EQ(equal_spacings(points), plain_count(points)) << seed;
  }
}

// 2^12 points among 2^32 days have 4 equal spacings on average. The mean of 400 trials has a
// deviation of 0.1: five of these are the tolerance.
TEST(birthday_spacings, have_the_mean_of_the_formula) {
  const std::size_t n = std::size_t{1} << 12;
  double sum = 0;
  for (std::uint64_t seed = 1; seed <= 400; ++seed)
    sum += static_cast<double>(equal_spacings(random_points(n, 0xFFFFFFFF, seed)));
  EXPECT_NEAR(sum / 400, std::ldexp(expected_equal_spacings(n), 32), 0.5);
  EXPECT_DOUBLE_EQ(expected_equal_spacings(std::size_t{1} << 23), 8.0);
}

TEST(poisson_chance, sums_the_law) {
  for (const double mean : {0.5, 8.0, 30.0}) {
    double below = 0;
    for (std::size_t count = 0; count < 60; ++count) {
      const auto k = static_cast<double>(count);
      const double equal = std::exp(k * std::log(mean) - mean - std::lgamma(k + 1));
      // Sixty terms of a few units in the last place each.
      EXPECT_NEAR(poisson_chance(count, mean), below + equal / 2, 1e-13) << count << " " << mean;
      below += equal;
    }
  }
}

TEST(poisson_chance, has_both_ends) {
  EXPECT_LT(poisson_chance(0, 30.0), 1e-12);
  EXPECT_GT(poisson_chance(40, 8.0), 1 - 1e-6);
  EXPECT_DOUBLE_EQ(poisson_chance(8'000'000, 8.0), 1.0);
}

}  // namespace
