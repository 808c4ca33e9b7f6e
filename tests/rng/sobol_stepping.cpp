// SPDX-License-Identifier: Apache-2.0
// Stepping and jumping of sobol in kernels against the Gray-code order itself, and who makes what
// in a call.
#include <cstdint>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "engines/sobol_kernels.hpp"
#include "every_engine.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using namespace rng::detail;

/// Words that are no pattern and not linearly dependent on purpose: of dimension 5.
std::vector<std::uint32_t> some_directions() {
  const tarn_test::plain_stream stream(RVX_BRNG_SOBOL, std::uint64_t{6});
  const std::uint32_t* const first = sobol_record(stream).directions(5);
  return {first, first + sobol_directions};
}

/// The word of point i by its definition.
std::uint32_t word_of(const std::vector<std::uint32_t>& directions, std::uint32_t i) {
  std::uint32_t word = 0;
  for (unsigned k = 0; k < 32; ++k) {
    if (((i ^ i / 2) >> k & 1) != 0) {
      word ^= directions[k];
    }
  }
  return word;
}

TEST(sobol_stepping, goes_from_each_point_to_the_next) {
  const auto directions = some_directions();
  for (const std::uint32_t first : {0u, 0x7FFFFF00u, 0xFFFEFFFFu, ~std::uint32_t{0} - 1000}) {
    std::uint32_t word = word_of(directions, first);
    for (std::uint32_t i = first; i != first + 1000; ++i) {
      ASSERT_EQ(word, word_of(directions, i)) << i;
      ASSERT_LT(sobol_step(i), sobol_directions);
      word ^= directions[sobol_step(i)];
    }
  }
}

TEST(sobol_stepping, goes_from_the_last_point_to_the_origin) {
  const auto directions = some_directions();
  const std::uint32_t last = ~std::uint32_t{0};
  EXPECT_NE(word_of(directions, last), 0u);
  EXPECT_EQ(word_of(directions, last) ^ directions[sobol_step(last)], 0u);
  EXPECT_EQ(word_of(directions, 12345) ^ sobol_jump(directions, 12345, 0), 0u);
}

TEST(sobol_stepping, jumps_between_any_two_points) {
  const auto directions = some_directions();
  const std::uint32_t places[] = {0, 1, 2, 3, 1000, 0x7FFFFFFF, 0x80000000, 0xDEADBEEF, 0xFFFFFFFF};
  for (const std::uint32_t from : places) {
    for (const std::uint32_t to : places) {
      EXPECT_EQ(word_of(directions, from) ^ sobol_jump(directions, from, to),
                word_of(directions, to))
          << from << " to " << to;
    }
  }
}

TEST(sobol_record_view, finds_what_a_stream_says) {
  for (const std::uint32_t dimensions : {1u, 2u, 47u, 48u, 49u, 50u, 1111u, 3667u}) {
    const tarn_test::plain_stream stream(RVX_BRNG_SOBOL, std::uint64_t{dimensions});
    const sobol_record record(stream);
    EXPECT_EQ(record.index(), 1u);
    EXPECT_EQ(record.dimensions(), dimensions);
    EXPECT_EQ(record.marker(), sobol_runs_on_devices);
    EXPECT_EQ(record.offset(), 0u);
    std::vector<std::uint32_t> words(dimensions);
    for (std::uint32_t d = 0; d < dimensions; ++d) {
      ASSERT_EQ(record.directions(d)[0], 0x80000000u) << d;  // as in every dimension
      ASSERT_EQ(record.directions(d)[sobol_directions], 0u) << d;
      ASSERT_EQ(record.point()[d], 0x80000000u) << d;
    }
    ASSERT_EQ(rvxiRngUniformBits(0, stream, dimensions, words.data()), 0);
    for (std::uint32_t d = 0; d < dimensions; ++d) {
      const std::vector<std::uint32_t> directions(record.directions(d), record.directions(d) + 32);
      ASSERT_EQ(record.point()[d], word_of(directions, 2)) << d;
    }
  }
}

// Every word of a call has its work-item, and items do not make many points more than they need.
TEST(sobol_walk_of_a_call, gives_every_point_to_an_item) {
  for (const std::uint32_t dimensions : {1u, 2u, 3u, 7u}) {
    for (std::uint32_t taken = 0; taken < dimensions; ++taken) {
      for (const std::uint64_t group_size : {1u, 2u, 64u}) {
        for (std::uint64_t n = 0; n < 3000; ++n) {
          const sobol_walk walk{nullptr, nullptr, dimensions, 1, taken, n};
          const std::uint64_t per_item = walk.points_per_item(group_size);
          const std::uint64_t points = (taken + n + dimensions - 1) / dimensions;
          ASSERT_EQ(per_item % 4, 0u);
          ASSERT_GE(per_item * group_size, points)
              << n << " in " << dimensions << ", taken " << taken;
          ASSERT_LE(per_item, points / group_size + 4);
        }
      }
    }
  }
}

}  // namespace
