// SPDX-License-Identifier: Apache-2.0
// The kernel functors of uniform, bits and uniform_bits on scripted numbers, and how the public
// parameters reach them.
#include <cmath>
#include <cstdint>
#include <limits>

#include <gtest/gtest.h>

#include "distributions/uniform.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using rng::detail::device_type;
using rng::detail::distribution_impl;

TEST(uniform_std, clamps_to_both_bounds_if_accurate) {
  const sycl::vec<float, 4> x(0.5f, 1.0f, 2.5f, 9.0f);
  const auto clamped = gpu::uniform_std<float, float>{1.0f, 2.0f, 1}(x);
  EXPECT_EQ(clamped[0], 1.0f);
  EXPECT_EQ(clamped[1], 1.0f);
  EXPECT_EQ(clamped[2], 2.0f);
  EXPECT_EQ(clamped[3], 2.0f);
  const auto as_drawn = gpu::uniform_std<float, float>{1.0f, 2.0f, 0}(x);
  for (int i = 0; i < 4; ++i) {
    EXPECT_EQ(as_drawn[i], x[i]);
  }
}

TEST(uniform_std, integers_are_floors_and_ignore_the_byte) {
  const sycl::vec<double, 4> x(-1.5, -0.25, 0.75, 12.0);
  for (const std::uint8_t accurate : {std::uint8_t{0}, std::uint8_t{1}}) {
    const auto values = gpu::uniform_std<std::int32_t, double>{0.0, 1.0, accurate}(x);
    EXPECT_EQ(values[0], -2);
    EXPECT_EQ(values[1], -1);
    EXPECT_EQ(values[2], 0);
    EXPECT_EQ(values[3], 12);
  }
}

TEST(floor_to_integer, gives_the_nearest_end_past_the_type) {
  EXPECT_EQ(gpu::floor_to_integer<std::int32_t>(2147483648.0f),
            std::numeric_limits<std::int32_t>::max());
  EXPECT_EQ(gpu::floor_to_integer<std::int32_t>(2147483520.0f), 2147483520);
  EXPECT_EQ(gpu::floor_to_integer<std::int32_t>(-2147483648.0f),
            std::numeric_limits<std::int32_t>::min());
  EXPECT_EQ(gpu::floor_to_integer<std::int32_t>(2147483646.5), 2147483646);
  EXPECT_EQ(gpu::floor_to_integer<std::uint32_t>(4294967296.0f),
            std::numeric_limits<std::uint32_t>::max());
  EXPECT_EQ(gpu::floor_to_integer<std::uint32_t>(-0.5f), 0u);
  EXPECT_EQ(gpu::floor_to_integer<std::uint32_t>(3000000000.0), 3000000000u);
}

TEST(uniform_bits_std, pairs_words_low_half_first) {
  const sycl::vec<std::uint32_t, 4> words(1u, 2u, 3u, 0xFFFFFFFFu);
  const auto pairs = gpu::uniform_bits_std<std::uint64_t>{}(words);
  EXPECT_EQ(pairs[0], 0x0000000200000001u);
  EXPECT_EQ(pairs[1], 0xFFFFFFFF00000003u);
}

template <typename T, typename Method>
auto functor_of(T a, T b) {
  return distribution_impl<T, rng::uniform<T, Method>, device_type::gpu>(
             rng::uniform<T, Method>(a, b))
      .kernel;
}

TEST(uniform_mapping, follows_type_and_method) {
  using standard = rng::uniform_method::standard;
  using accurate = rng::uniform_method::accurate;
  EXPECT_EQ((functor_of<float, standard>(0, 1).accurate), 0);
  EXPECT_EQ((functor_of<double, accurate>(0, 1).accurate), 1);
  // Integers: through float in the standard method, through double in the accurate one.
  const auto narrow = functor_of<std::int32_t, standard>(-16777217, 16777217);
  static_assert(std::is_same_v<decltype(narrow.a), float>);
  EXPECT_EQ(narrow.a, -16777216.0f);
  const auto wide = functor_of<std::int32_t, accurate>(-16777217, 16777217);
  static_assert(std::is_same_v<decltype(wide.a), double>);
  EXPECT_EQ(wide.a, -16777217.0);
  EXPECT_EQ(wide.accurate, 1);
  const auto unsigned_bounds = functor_of<std::uint32_t, standard>(3000000000u, 4294967295u);
  EXPECT_EQ(unsigned_bounds.a, 3000000000.0f);
  EXPECT_EQ(unsigned_bounds.b, 4294967296.0f);
}

}  // namespace
