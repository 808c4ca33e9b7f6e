// SPDX-License-Identifier: Apache-2.0
// The linear complexity against its definition, the shortest register that gives the bits, and its
// law against a count over all sequences.
#include <cmath>
#include <random>

#include <gtest/gtest.h>

#include "quality/linear_complexity.hpp"

namespace {

using namespace tarn::quality;
using bit_list = std::vector<std::uint8_t>;

// Bit i of `number` is bit i of the sequence.
bit_list bits_of(std::uint32_t number, std::size_t n) {
  bit_list bits;
  for (std::size_t i = 0; i < n; ++i)
    bits.push_back(static_cast<std::uint8_t>(number >> i & 1));
  return bits;
}

// Whether a register of this length with these taps goes on from its first bits to all others.
bool gives(const bit_list& bits, std::size_t length, std::uint32_t taps) {
  for (std::size_t i = length; i < bits.size(); ++i) {
    unsigned sum = 0;
    for (std::size_t j = 0; j < length; ++j)
      sum ^= (taps >> j & 1) & bits[i - 1 - j];
    if (sum != bits[i])
      return false;
  }
  return true;
}

std::size_t shortest_register(const bit_list& bits) {
  for (std::size_t length = 0; length < bits.size(); ++length)
    for (std::uint32_t taps = 0; taps < 1u << length; ++taps)
      if (gives(bits, length, taps))
        return length;
  return bits.size();
}

// x(i) = x(i - lag) xor x(i - length) from a random start.
bit_list shift_register(std::size_t length, std::size_t lag, std::size_t n) {
  std::mt19937 random(4242);
  bit_list bits(n);
  for (std::size_t i = 0; i < n; ++i)
    bits[i] =
        static_cast<std::uint8_t>(i < length ? random() & 1 : bits[i - lag] ^ bits[i - length]);
  return bits;
}

TEST(linear_complexity, is_the_length_of_the_shortest_register) {
  for (std::size_t n = 0; n <= 9; ++n)
    for (std::uint32_t number = 0; number < 1u << n; ++number)
      ASSERT_EQ(linear_complexity(bits_of(number, n)), shortest_register(bits_of(number, n)))
          << number << " of " << n << " bits";
}

// The polynomials t^250 + t^103 + 1, t^1279 + t^418 + 1 and t^63 + t + 1 are primitive, so that no
// shorter register gives what they give; the lengths go over several words and to their edges.
TEST(linear_complexity, of_long_registers) {
  for (const std::size_t n : {500u, 511u, 512u, 513u, 2000u, 6000u})
    EXPECT_EQ(linear_complexity(shift_register(250, 103, n)), 250u) << n;
  for (const std::size_t n : {126u, 127u, 128u, 129u, 5000u})
    EXPECT_EQ(linear_complexity(shift_register(63, 62, n)), 63u) << n;
  EXPECT_EQ(linear_complexity(shift_register(1279, 418, 2600)), 1279u);
}

TEST(linear_complexity, of_a_late_one) {
  for (const std::size_t n : {1u, 63u, 64u, 65u, 200u, 1025u}) {
    bit_list bits(n);
    EXPECT_EQ(linear_complexity(bits), 0u);
    bits.back() = 1;
    EXPECT_EQ(linear_complexity(bits), n);
  }
}

// Sums of at most 2^12 powers of two are exact.
TEST(linear_complexity, has_the_law_of_a_full_count) {
  for (const std::size_t n : {1u, 2u, 7u, 12u}) {
    std::vector<double> count(n + 1);
    for (std::uint32_t number = 0; number < 1u << n; ++number)
      ++count[linear_complexity(bits_of(number, n))];
    double below = 0;
    for (std::size_t length = 0; length <= n; ++length) {
      EXPECT_NEAR(linear_complexity_chance(n, length),
                  std::ldexp(below + count[length] / 2, -static_cast<int>(n)), 1e-15)
          << length << " of " << n;
      below += count[length];
    }
    EXPECT_EQ(below, std::ldexp(1.0, static_cast<int>(n)));
  }
}

// The bounds that judge the values: too small and too large complexities show.
TEST(linear_complexity, has_small_chances_at_both_ends) {
  EXPECT_LT(linear_complexity_chance(200'000, 79'872), 1e-300);
  EXPECT_LT(linear_complexity_chance(200'000, 99'985), 1e-6);
  EXPECT_GT(linear_complexity_chance(200'000, 100'000), 0.4);
  EXPECT_LT(linear_complexity_chance(200'000, 100'000), 0.6);
  EXPECT_GT(linear_complexity_chance(200'000, 100'015), 1 - 1e-6);
}

}  // namespace
