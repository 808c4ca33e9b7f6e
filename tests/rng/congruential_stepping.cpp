// SPDX-License-Identifier: Apache-2.0
// The kernel-side stepping of mcg31m1 and mcg59 by itself, against plain arithmetic with division.
#include <array>
#include <cmath>
#include <cstdint>
#include <random>

#include <gtest/gtest.h>

#include "engines/mcg31m1.hpp"
#include "engines/mcg59.hpp"

namespace {

namespace detail = kestrel::tarn::rng::detail;
namespace rng = kestrel::tarn::rng;
using detail::engine_traits;
using detail::word_rule;
using detail::gpu::drawn;
__extension__ typedef unsigned __int128 uint128;

constexpr std::uint64_t modulus_31 = 0x7FFFFFFF;
constexpr std::uint64_t modulus_59 = std::uint64_t{1} << 59;

/// a^exponent x modulo `modulus`, one exact product after the other.
std::uint64_t jumped(std::uint64_t a, std::uint64_t exponent, std::uint64_t x,
                     std::uint64_t modulus) {
  uint128 result = x % modulus;
  uint128 square = a % modulus;
  for (; exponent != 0; exponent >>= 1) {
    if ((exponent & 1) != 0) {
      result = result * square % modulus;
    }
    square = square * square % modulus;
  }
  return static_cast<std::uint64_t>(result);
}

template <typename Engine, drawn asks, typename R>
std::array<R, 4> four(typename engine_traits<Engine>::record state, std::uint64_t block,
                      word_rule<R> rule) {
  sycl::vec<R, 4> out(static_cast<R>(77));
  engine_traits<Engine>::template four<asks>(&state, block, out, rule);
  return {out[0], out[1], out[2], out[3]};
}

std::array<std::uint32_t, 4> words_31(std::uint32_t x, std::uint32_t a, std::uint64_t block) {
  return four<rng::mcg31m1, drawn::words, std::uint32_t>({x, a}, block, {0, 0});
}

constexpr std::uint64_t far_blocks[] = {0, 1, 2, 3, 1000, 0x7FFFFFFF, 0xFFFFFFFF};

TEST(mcg31m1_stepping, equals_powers_of_the_multiplier) {
  std::mt19937 random(1);
  for (int round = 0; round < 2000; ++round) {
    const auto a = static_cast<std::uint32_t>(1 + random() % (modulus_31 - 1));
    const auto x = static_cast<std::uint32_t>(1 + random() % (modulus_31 - 1));
    for (const std::uint64_t block : far_blocks) {
      const auto words = words_31(x, a, block);
      for (std::uint64_t i = 0; i < 4; ++i) {
        ASSERT_EQ(words[i], jumped(a, 4 * block + i, x, modulus_31)) << block << " " << i;
      }
    }
  }
}

TEST(mcg31m1_stepping, the_first_word_is_the_state_itself) {
  EXPECT_EQ(words_31(12345, 1132489760, 0)[0], 12345u);
}

// The fold leaves the modulus where it is instead of taking it to 0.
TEST(mcg31m1_stepping, a_state_of_the_modulus_stays) {
  const auto m = static_cast<std::uint32_t>(modulus_31);
  for (const std::uint64_t block : {0u, 1u, 77u}) {
    EXPECT_EQ(words_31(m, 1132489760, block), (std::array<std::uint32_t, 4>{m, m, m, m}));
  }
}

// In double the unit is the reciprocal of the modulus, so that the greatest word gives the upper
// bound; in float it is a power of two.
TEST(mcg31m1_stepping, only_a_double_reaches_the_upper_bound) {
  const auto m = static_cast<std::uint32_t>(modulus_31);
  const auto reals = four<rng::mcg31m1, drawn::reals, double>({m, 1}, 0, {-3.0, 5.0});
  EXPECT_EQ(reals[0], 5.0);
  const auto floats = four<rng::mcg31m1, drawn::reals, float>({1u << 30, 1}, 0, {0.0f, 1.0f});
  EXPECT_EQ(floats[0], 0.5f);
  const auto halves = four<rng::mcg31m1, drawn::reals, double>({1u << 30, 1}, 0, {0.0, 1.0});
  EXPECT_EQ(halves[0], std::fma(0x1p30, 1.0 / 2147483647.0, 0.0));
}

std::uint64_t random_59(std::mt19937_64& random) {
  return random() % modulus_59;
}

TEST(mcg59_stepping, equals_powers_of_the_multiplier) {
  std::mt19937_64 random(2);
  for (int round = 0; round < 1000; ++round) {
    const std::uint64_t a = random_59(random) | 1;
    const std::uint64_t x = random_59(random) | 1;
    for (const std::uint64_t block : far_blocks) {
      const auto bits = four<rng::mcg59, drawn::bits, std::uint32_t>({x, a}, block, {0, 0});
      const auto words = four<rng::mcg59, drawn::words, std::uint32_t>({x, a}, block, {0, 0});
      const auto reals = four<rng::mcg59, drawn::reals, double>({x, a}, block, {1.0, 3.0});
      for (std::uint64_t i = 0; i < 4; ++i) {
        const std::uint64_t word = jumped(a, 4 * block + i, x, modulus_59);
        ASSERT_EQ(bits[i], static_cast<std::uint32_t>(word >> 27));
        ASSERT_EQ(reals[i], std::fma(static_cast<double>(word), 0x1p-58, 1.0));
      }
      for (std::uint64_t i = 0; i < 2; ++i) {
        const std::uint64_t word = jumped(a, 2 * block + i, x, modulus_59);
        ASSERT_EQ(words[2 * i], static_cast<std::uint32_t>(word));
        ASSERT_EQ(words[2 * i + 1], static_cast<std::uint32_t>(word >> 32));
      }
    }
  }
}

// Bits above the 59 may stand in the record: multiplication only carries upward.
TEST(mcg59_stepping, bits_above_the_word_do_not_count) {
  const std::uint64_t a = 302875106592253;  // 13^13
  const std::uint64_t x = 0x0123456789ABCDEF & (modulus_59 - 1);
  const std::uint64_t dirty = x | std::uint64_t{0x1F} << 59;
  for (const std::uint64_t block : {0u, 5u}) {
    EXPECT_EQ((four<rng::mcg59, drawn::words, std::uint32_t>({dirty, a}, block, {0, 0})),
              (four<rng::mcg59, drawn::words, std::uint32_t>({x, a}, block, {0, 0})));
    EXPECT_EQ((four<rng::mcg59, drawn::reals, float>({dirty, a}, block, {0, 1})),
              (four<rng::mcg59, drawn::reals, float>({x, a}, block, {0, 1})));
  }
}

}  // namespace
