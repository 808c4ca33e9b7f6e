// SPDX-License-Identifier: Apache-2.0
// philox4x32x10 through generate on every queue: published words, the same bits on the host road
// and the device road, and any cut of a call into pieces.
#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <limits>
#include <string>
#include <thread>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "models/philox_model.hpp"
#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using tarn_test::draw;
using tarn_test::draw_into_buffer;
using tarn_test::philox_at;
using tarn_test::philox_model;
using tarn_test::uint128;
using words = std::vector<std::uint32_t>;

const std::array<std::uint32_t, 2> some_key{0x12345678u, 0x9ABCDEF0u};

words model_words(uint128 ctr, uint128 first, std::size_t count) {
  const philox_model model(some_key[0], some_key[1], ctr);
  words out;
  for (std::size_t i = 0; i < count; ++i) {
    out.push_back(model.word(first + i));
  }
  return out;
}

/// An engine at word `first` behind the block `ctr`.
rng::philox4x32x10 engine_at(const sycl::queue& queue, uint128 ctr, std::uint64_t first) {
  std::array<std::uint32_t, 4> lanes;
  for (unsigned i = 0; i < 4; ++i) {
    lanes[i] = static_cast<std::uint32_t>(ctr >> (32 * i));
  }
  rng::philox4x32x10 engine = philox_at(queue, some_key, lanes);
  rng::skip_ahead(engine, first);
  return engine;
}

class philox_road : public tarn_test::over_queues {};
TARN_OVER_QUEUES(philox_road);
TARN_REPORTS_CUDA(philox_road)

TEST_P(philox_road, every_count_from_every_place_in_a_block) {
  for (std::uint64_t first = 0; first < 4; ++first) {
    for (std::int64_t n = 0; n <= 300; ++n) {
      auto engine = engine_at(queue(), 1000, first);
      ASSERT_EQ(draw(rng::bits<>(), engine, n),
                model_words(1000, first, static_cast<std::size_t>(n)))
          << "n " << n << " from word " << first;
      ASSERT_EQ(draw(rng::bits<>(), engine, 3),
                model_words(1000, first + static_cast<std::uint64_t>(n), 3))
          << "after n " << n << " from word " << first;
    }
  }
}

// Counters next to the carries, approached so that no call begins in the middle of the block that
// carries: there the device road has carries of its own (see below).
TEST_P(philox_road, counters_next_to_their_carries) {
  for (const int exponent : {32, 64, 96}) {
    for (std::uint64_t back = 0; back <= 6; ++back) {
      const uint128 ctr = (uint128{1} << exponent) - back;
      auto engine = engine_at(queue(), ctr, 0);
      ASSERT_EQ(draw(rng::bits<>(), engine, 61), model_words(ctr, 0, 61))
          << "2^" << exponent << " - " << back;
    }
  }
  auto last = engine_at(queue(), ~uint128{0} - 1, 0);
  EXPECT_EQ(draw(rng::bits<>(), last, 23), model_words(~uint128{0} - 1, 0, 23));
}

TEST(philox_on_a_cpu, carries_in_mid_block_are_those_of_the_sequence) {
  for (const uint128 carry : {uint128{1} << 32, uint128{1} << 64, uint128{1} << 96, uint128{0}}) {
    const uint128 ctr = carry - 2;  // 0 stands for 2^128
    for (std::uint64_t first = 1; first < 16; ++first) {
      for (std::int64_t cut = 0; cut <= 30; cut += 3) {
        auto engine = engine_at(tarn_test::cpu_queue(), ctr, first);
        words drawn = draw(rng::bits<>(), engine, cut);
        const words rest = draw(rng::bits<>(), engine, 30 - cut);
        drawn.insert(drawn.end(), rest.begin(), rest.end());
        ASSERT_EQ(drawn, model_words(ctr, first, 30)) << "cut at " << cut;
      }
    }
  }
}

// A call that begins in the middle of the block before a multiple of 2^32 steps back over a zero
// word, and the kernel's carry test then reads the first words from another block. Kept: results
// depend on it. Only the words up to the end of that block are touched.
TEST(philox_on_a_gpu, mid_block_start_before_a_multiple_of_2_to_32_reads_another_block) {
  const uint128 ctr = (uint128{7} << 32) - 1;  // the record then stands at ctr + 1, idx 4 - first
  for (std::uint64_t first = 1; first < 4; ++first) {
    auto engine = engine_at(tarn_test::gpu_queue(), ctr, first);
    const words drawn = draw(rng::bits<>(), engine, 12);
    words expected = model_words(ctr, first, 12);
    const words other = model_words(ctr + (uint128{1} << 64), first, 4 - first);
    std::copy(other.begin(), other.end(), expected.begin());
    EXPECT_EQ(drawn, expected) << "from word " << first;
  }
}

// The same before a multiple of 2^64: there both low words become all ones and the upper ones stay.
TEST(philox_on_a_gpu, mid_block_start_before_a_multiple_of_2_to_64_reads_another_block) {
  for (const uint128 ctr : {(uint128{1} << 64) - 1, (uint128{5} << 64) - 1, ~uint128{0}}) {
    const uint128 other_ctr = ((ctr + 1) >> 64 << 64) + ~std::uint64_t{0};
    for (std::uint64_t first = 1; first < 4; ++first) {
      auto engine = engine_at(tarn_test::gpu_queue(), ctr, first);
      const words drawn = draw(rng::bits<>(), engine, 12);
      words expected = model_words(ctr, first, 12);
      const words other = model_words(other_ctr, first, 4 - first);
      std::copy(other.begin(), other.end(), expected.begin());
      EXPECT_EQ(drawn, expected) << "from word " << first;
    }
  }
}

/// Every way to cut 24 results into three calls, against one call.
template <typename Distr>
void expect_cuts_to_agree(const sycl::queue& queue, const Distr& distr) {
  constexpr std::int64_t total = 24;
  auto whole_engine = engine_at(queue, 50, 1);
  const auto whole = draw(distr, whole_engine, total);
  for (std::int64_t first = 0; first <= total; ++first) {
    for (std::int64_t second = 0; first + second <= total; ++second) {
      auto engine = engine_at(queue, 50, 1);
      auto values = draw(distr, engine, first);
      for (const std::int64_t n : {second, total - first - second}) {
        const auto more = draw(distr, engine, n);
        values.insert(values.end(), more.begin(), more.end());
      }
      ASSERT_EQ(values, whole) << first << " + " << second << " + rest";
    }
  }
}

TEST_P(philox_road, any_cut_of_a_call_gives_the_same_results) {
  expect_cuts_to_agree(queue(), rng::bits<>());
  expect_cuts_to_agree(queue(), rng::uniform_bits<std::uint32_t>());
  expect_cuts_to_agree(queue(), rng::uniform_bits<std::uint64_t>());
  expect_cuts_to_agree(queue(), rng::uniform<float>(-1.0f, 3.0f));
  expect_cuts_to_agree(queue(), rng::uniform<double>(-1.0, 3.0));
  expect_cuts_to_agree(queue(), rng::uniform<std::int32_t>(-50, 50));
  expect_cuts_to_agree(queue(), rng::uniform<std::uint32_t, rng::uniform_method::accurate>(3, 99));
}

/// One distribution on one queue against another, in both output forms, at sizes around blocks and
/// above the thresholds of the host library.
template <typename Distr>
void expect_same_on(const sycl::queue& one, const sycl::queue& other, const Distr& distr) {
  for (const std::int64_t n : {1, 5, 64, 1023, 4099, 300001}) {
    for (const std::uint64_t first : {0u, 3u}) {
      auto engine = engine_at(one, 10, first);
      auto same = engine_at(one, 10, first);
      auto remote = engine_at(other, 10, first);
      const auto values = draw(distr, engine, n);
      ASSERT_EQ(values, draw(distr, remote, n)) << "n " << n;
      ASSERT_EQ(values, draw_into_buffer(distr, same, n)) << "buffer, n " << n;
    }
  }
}

TEST_P(philox_road, equals_the_host_road_bit_for_bit) {
  const sycl::queue cpu = tarn_test::cpu_queue();
  using accurate = rng::uniform_method::accurate;
  expect_same_on(queue(), cpu, rng::bits<>());
  expect_same_on(queue(), cpu, rng::uniform_bits<std::uint32_t>());
  expect_same_on(queue(), cpu, rng::uniform_bits<std::uint64_t>());
  expect_same_on(queue(), cpu, rng::uniform<float>());
  expect_same_on(queue(), cpu, rng::uniform<float>(-1e30f, 3e30f));
  expect_same_on(queue(), cpu, rng::uniform<float, accurate>(1.0f, 1.0000001f));
  expect_same_on(queue(), cpu, rng::uniform<double>(-0.1, 0.7));
  expect_same_on(queue(), cpu, rng::uniform<double, accurate>(5.0, 5.000001));
  expect_same_on(queue(), cpu, rng::uniform<std::int32_t>(-1000000000, 2000000000));
  expect_same_on(queue(), cpu, rng::uniform<std::int32_t>());
  // Without a sign, truncation and floor are the same, so these agree as well.
  expect_same_on(queue(), cpu, rng::uniform<std::uint32_t, accurate>(0, 4000000000u));
  expect_same_on(queue(), cpu, rng::uniform<std::int32_t, accurate>(0, 2000000000));
}

TEST_P(philox_road, reals_follow_the_rule_word_by_word) {
  auto word_engine = engine_at(queue(), 0, 0);
  auto engine = engine_at(queue(), 0, 0);
  const words drawn = draw(rng::bits<>(), word_engine, 1000);
  const std::vector<float> reals = draw(rng::uniform<float>(-2.0f, 5.0f), engine, 1000);
  for (std::size_t i = 0; i < drawn.size(); ++i) {
    const auto word = static_cast<float>(static_cast<std::int32_t>(drawn[i]));
    ASSERT_EQ(reals[i], std::fma(word, (5.0f - -2.0f) * 0x1p-32f, (-2.0f + 5.0f) * 0.5f)) << i;
  }
}

TEST_P(philox_road, sixty_four_bits_are_two_words_low_half_first) {
  auto word_engine = engine_at(queue(), 0, 1);
  auto engine = engine_at(queue(), 0, 1);
  const words drawn = draw(rng::bits<>(), word_engine, 14);
  const auto pairs = draw(rng::uniform_bits<std::uint64_t>(), engine, 7);
  for (std::size_t i = 0; i < pairs.size(); ++i) {
    EXPECT_EQ(pairs[i], std::uint64_t{drawn[2 * i + 1]} << 32 | drawn[2 * i]);
  }
  EXPECT_EQ(draw(rng::bits<>(), engine, 3), draw(rng::bits<>(), word_engine, 3));
}

TEST_P(philox_road, accurate_results_stay_inside_the_range) {
  using accurate = rng::uniform_method::accurate;
  for (const float b : {std::nextafter(1.0f, 2.0f), 1.5f, 1e30f}) {
    auto engine = engine_at(queue(), 0, 0);
    for (const float x : draw(rng::uniform<float, accurate>(1.0f, b), engine, 5000)) {
      ASSERT_TRUE(x >= 1.0f && x <= b) << x;
    }
  }
}

TEST_P(philox_road, wide_standard_integers_have_float_resolution) {
  auto engine = engine_at(queue(), 0, 0);
  const rng::uniform<std::int32_t> wide(-2000000000, 2000000000);
  for (const std::int32_t x : draw(wide, engine, 5000)) {
    ASSERT_EQ(static_cast<std::int32_t>(static_cast<float>(x)), x);
    ASSERT_GE(x, -2000000000);
    ASSERT_LE(x, 2000000000);
  }
}

TEST_P(philox_road, an_upper_bound_past_the_type_gives_its_greatest_value) {
  // (float)2147483647 is 2^31, which rounding reaches and an int32 does not.
  auto engine = engine_at(queue(), 0, 0);
  const rng::uniform<std::int32_t> top(2147483500, 2147483647);
  const auto drawn = draw(top, engine, 5000);
  for (const std::int32_t x : drawn) {
    ASSERT_GE(x, 2147483500 - 64);  // float neighbours are 128 apart here
  }
  EXPECT_EQ(std::count(drawn.begin(), drawn.end(), std::numeric_limits<std::int32_t>::max()) > 0,
            true);
}

TEST(philox_on_a_gpu, equal_bounds_give_the_bound) {
  auto engine = engine_at(tarn_test::gpu_queue(), 0, 0);
  EXPECT_EQ(draw(rng::uniform<float>(2.5f, 2.5f), engine, 9), std::vector<float>(9, 2.5f));
}

// Unsigned bounds above 2^31 go to double and are rounded once, never through a signed type.
TEST(philox_on_a_gpu, unsigned_bounds_keep_their_value) {
  auto engine = engine_at(tarn_test::gpu_queue(), 0, 0);
  const rng::uniform<std::uint32_t> high(3000000000u, 4000000000u);
  for (const std::uint32_t x : draw(high, engine, 2000)) {
    ASSERT_GE(x, 3000000000u);
    ASSERT_LE(x, 4000000000u);
  }
}

// Truncation on the host and floor on the device part for negative integers drawn in double.
TEST(roads, part_for_negative_accurate_integers) {
  const rng::uniform<std::int32_t, rng::uniform_method::accurate> distr(-10, 0);
  auto host_engine = engine_at(tarn_test::cpu_queue(), 0, 0);
  auto device_engine = engine_at(tarn_test::gpu_queue(), 0, 0);
  const auto host = draw(distr, host_engine, 4000);
  const auto device = draw(distr, device_engine, 4000);
  for (std::size_t i = 0; i < host.size(); ++i) {
    ASSERT_EQ(host[i], device[i] + 1);  // no result is a whole number before rounding
  }
}

// Engines share nothing, so threads may each use their own, from the first use of the library on.
TEST(roads, threads_with_engines_of_their_own_do_not_disturb_each_other) {
  constexpr std::int64_t n = 5000;
  std::vector<std::thread> threads;
  std::array<words, 8> drawn;
  for (std::size_t t = 0; t < drawn.size(); ++t) {
    threads.emplace_back([&drawn, t] {
      const sycl::queue queue = t % 2 == 0 ? tarn_test::cpu_queue() : tarn_test::gpu_queue();
      auto engine = engine_at(queue, 100 * t, 1);
      for (int call = 0; call < 10; ++call) {
        const words more = draw(rng::bits<>(), engine, n / 10);
        drawn[t].insert(drawn[t].end(), more.begin(), more.end());
      }
    });
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
  for (std::size_t t = 0; t < drawn.size(); ++t) {
    EXPECT_EQ(drawn[t], model_words(100 * t, 1, n)) << "thread " << t;
  }
}

// Integers on the host pass through doubles in half of the output above 2048 results; around that
// size, and from memory that is not aligned for doubles, the values are those of a plain loop.
TEST(philox_on_a_cpu, integers_in_place_equal_a_plain_loop) {
  using accurate = rng::uniform_method::accurate;
  const rng::uniform<std::int32_t, accurate> distr(-1000000, 3000000);
  sycl::queue queue = tarn_test::cpu_queue();
  for (const std::int64_t n : {1, 1023, 1024, 1025, 2047, 2048, 2049, 2050, 2051, 5000, 100001}) {
    for (const std::size_t shift : {0u, 1u}) {
      auto real_engine = engine_at(queue, 0, 2);
      auto engine = engine_at(queue, 0, 2);
      const auto reals = draw(rng::uniform<double>(-1000000.0, 3000000.0), real_engine, n);
      const auto count = static_cast<std::size_t>(n);
      std::vector<std::int32_t> values(count + shift + 1, 77);
      rng::generate(distr, engine, n, values.data() + shift).wait();
      EXPECT_EQ(values.back(), 77);
      for (std::size_t i = 0; i < count; ++i) {
        ASSERT_EQ(values[shift + i], static_cast<std::int32_t>(reals[i])) << n << " at " << i;
      }
      // Unsigned integers are drawn the same way in both methods.
      auto unsigned_engine = engine_at(queue, 0, 2);
      auto unsigned_reals = engine_at(queue, 0, 2);
      const auto wide = draw(rng::uniform<double>(5.0, 4294967295.0), unsigned_reals, n);
      const auto numbers = draw(rng::uniform<std::uint32_t>(5u, 4294967295u), unsigned_engine, n);
      for (std::size_t i = 0; i < count; ++i) {
        ASSERT_EQ(numbers[i], static_cast<std::uint32_t>(wide[i])) << n << " at " << i;
      }
    }
  }
}

}  // namespace
