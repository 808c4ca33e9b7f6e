// SPDX-License-Identifier: Apache-2.0
// The kernel-side stepping of philox4x32x10 by itself: published blocks, every idx, and the
// carries of the counter, the peculiar ones included.
#include <array>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <limits>

#include <gtest/gtest.h>

#include "engines/philox4x32x10.hpp"
#include "frame/device_road.hpp"
#include "models/philox_model.hpp"

namespace {

namespace detail = kestrel::tarn::rng::detail;
using record = detail::tag_rvx_sycl_brng_philox4x32x10_stream_t;
using tarn_test::philox_model;
using tarn_test::uint128;
using block = std::array<std::uint32_t, 4>;

record record_at(uint128 ctr, std::uint32_t idx) {
  record state{{0x12345678u, 0x9ABCDEF0u}, {}, idx};
  for (int i = 0; i < 4; ++i) {
    state.ctr[i] = static_cast<std::uint32_t>(ctr >> (32 * i));
  }
  return state;
}

block four_words(record state, std::uint64_t n) {
  sycl::vec<std::uint32_t, 4> out(0xA5A5A5A5u);
  detail::philox4x32x10_generate<std::uint32_t>(&state, n, out, 0, 0);
  return {out[0], out[1], out[2], out[3]};
}

/// Words P + 4n to P + 4n + 3 of the sequence, P = 4 * ctr - idx.
block serial_words(uint128 ctr, std::uint32_t idx, std::uint64_t n) {
  const philox_model model(0x12345678u, 0x9ABCDEF0u);
  const uint128 first = 4 * ctr - idx + 4 * uint128{n};
  block words;
  for (unsigned i = 0; i < 4; ++i) {
    words[i] = model.word(first + i);
  }
  return words;
}

constexpr uint128 pow2(int exponent) {
  return uint128{1} << exponent;
}

TEST(philox_rounds, zero_counter_with_zero_key) {
  std::uint32_t ctr[4] = {};
  std::uint32_t key[2] = {};
  detail::philox4x32x10_round_brute_10(ctr, key);
  EXPECT_EQ((block{ctr[0], ctr[1], ctr[2], ctr[3]}),
            (block{0x6627E8D5u, 0xE169C58Du, 0xBC57AC4Cu, 0x9B00DBD8u}));
}

TEST(philox_stepping, reads_the_serial_sequence_from_every_idx) {
  const uint128 counters[] = {5,
                              pow2(32) - 1,
                              pow2(32),
                              pow2(32) + 1,
                              pow2(64) - 3,
                              pow2(64) + 9,
                              pow2(96) - 2,
                              pow2(96) + 5,
                              pow2(125) + 12345};
  for (const uint128 ctr : counters) {
    for (std::uint32_t idx = 0; idx <= 4; ++idx) {
      for (const std::uint64_t n : {1ull, 2ull, 3ull, 7ull, 0xFFFFFFFFull, 0x100000000ull}) {
        EXPECT_EQ(four_words(record_at(ctr, idx), n), serial_words(ctr, idx, n))
            << "low counter " << static_cast<std::uint64_t>(ctr) << " idx " << idx << " n " << n;
      }
      if (idx == 0) {
        EXPECT_EQ(four_words(record_at(ctr, 0), 0), serial_words(ctr, 0, 0));
      }
    }
  }
}

TEST(philox_stepping, work_item_zero_in_mid_block_steps_back_when_the_first_word_is_not_zero) {
  for (const uint128 ctr : {uint128{5}, pow2(32) + 1, pow2(64) + 1, pow2(125) + 12345}) {
    for (std::uint32_t idx = 1; idx <= 3; ++idx) {
      EXPECT_EQ(four_words(record_at(ctr, idx), 0), serial_words(ctr, idx, 0));
    }
  }
}

TEST(philox_stepping, aligned_path_carries_past_64_bits) {
  EXPECT_EQ(four_words(record_at(pow2(64) - 1, 0), 1), serial_words(pow2(64) - 1, 0, 1));
  EXPECT_EQ(four_words(record_at(~uint128{0}, 0), 1), serial_words(~uint128{0}, 0, 1));
}

// The step back by one block is an addition of 2^64 - 1 whose carry test compares with the summand:
// the high half gets 1 too many unless the low half is 0.
TEST(philox_stepping, idx_4_in_work_item_zero_carries_into_the_high_half) {
  const uint128 ctr = (uint128{8} << 64) + 77;
  const uint128 read = (uint128{9} << 64) + 76;
  EXPECT_EQ(four_words(record_at(ctr, 4), 0), serial_words(read, 0, 0));
  const uint128 low_zero = uint128{8} << 64;
  EXPECT_EQ(four_words(record_at(low_zero, 4), 0),
            serial_words((uint128{8} << 64) + 0xFFFFFFFFFFFFFFFFu, 0, 0));
  // From work-item 1 on there is no step back.
  EXPECT_EQ(four_words(record_at(ctr, 4), 1), serial_words(ctr, 4, 1));
}

// In mid-block the step back goes word by word, and its tests carry where nothing overflowed.
TEST(philox_stepping, mid_block_step_back_from_a_zero_word_carries_into_the_third) {
  const philox_model model(0x12345678u, 0x9ABCDEF0u);
  const auto words = [&](uint128 earlier, uint128 later, std::uint32_t idx) {
    block out;
    for (std::uint32_t i = 0; i < 4; ++i) {
      out[i] = i < idx ? model.block(earlier)[4 - idx + i] : model.block(later)[i - idx];
    }
    return out;
  };
  const uint128 high = uint128{8} << 64;
  for (std::uint32_t idx = 1; idx <= 3; ++idx) {
    // c[0] = 0, c[1] = 7: c[1] becomes 6 with c[0] all ones, and c[2] nevertheless gets 1.
    const uint128 ctr = high + (uint128{7} << 32);
    EXPECT_EQ(four_words(record_at(ctr, idx), 0), words(ctr - 1 + pow2(64), ctr, idx));
    // c[0] = c[1] = 0: both become all ones, and the upper words stay.
    EXPECT_EQ(four_words(record_at(high, idx), 0), words(high + 0xFFFFFFFFFFFFFFFFu, high, idx));
  }
}

TEST(philox_stepping, an_idx_that_no_stream_has_leaves_the_output_alone) {
  for (const std::uint32_t idx : {5u, 6u, 7u, 8u, 12u, 0xFFFFFFFFu}) {
    EXPECT_EQ(four_words(record_at(5, idx), 1),
              (block{0xA5A5A5A5u, 0xA5A5A5A5u, 0xA5A5A5A5u, 0xA5A5A5A5u}));
  }
}

TEST(philox_stepping, reals_are_one_multiply_add_of_the_signed_word) {
  const block words = serial_words(1000, 0, 3);
  record state = record_at(1000, 0);
  sycl::vec<float, 4> floats;
  detail::philox4x32x10_generate<float>(&state, 3, floats, 0x1p-32f, 0.5f);
  state = record_at(1000, 0);
  sycl::vec<double, 4> doubles;
  detail::philox4x32x10_generate<double>(&state, 3, doubles, 0x1p-30, -2.0);
  for (int i = 0; i < 4; ++i) {
    const auto word = static_cast<std::int32_t>(words[static_cast<std::size_t>(i)]);
    EXPECT_EQ(floats[i], std::fma(static_cast<float>(word), 0x1p-32f, 0.5f));
    EXPECT_EQ(doubles[i], std::fma(static_cast<double>(word), 0x1p-30, -2.0));
  }
}

TEST(launch, has_one_work_item_for_each_started_block) {
  using detail::work_items;
  EXPECT_EQ(work_items(0, 4), 0u);
  EXPECT_EQ(work_items(1, 4), 1u);
  EXPECT_EQ(work_items(4, 4), 1u);
  EXPECT_EQ(work_items(5, 4), 2u);
  EXPECT_EQ(work_items(3, 2), 2u);
  EXPECT_EQ(work_items(4 * std::int64_t{0x7FFFFFFF}, 4), 0x7FFFFFFFu);
  // A count next to 2^63 does not wrap to a small range: it stays above every limit.
  EXPECT_GT(work_items(std::numeric_limits<std::int64_t>::max(), 4), 0x7FFFFFFFu);
}

TEST(philox_rule, scale_and_offset_of_the_unit_interval_are_exact) {
  const auto rule_of = [](auto lo, auto hi) {
    return detail::engine_traits<kestrel::tarn::rng::philox4x32x10>::rule(
        detail::gpu::real_range<decltype(lo)>{lo, hi});
  };
  const float scale = rule_of(0.0f, 1.0f).a;
  std::uint32_t pattern;
  std::memcpy(&pattern, &scale, sizeof pattern);
  EXPECT_EQ(pattern, 0x2F800000u);
  EXPECT_EQ(rule_of(0.0, 1.0).a, 2.3283064365386963e-10);
  EXPECT_EQ(rule_of(0.0f, 1.0f).b, 0.5f);
  EXPECT_EQ(rule_of(-3.0, 5.0).b, 1.0);
}

}  // namespace
