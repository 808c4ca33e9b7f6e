// SPDX-License-Identifier: Apache-2.0
// The device road against the host road for each engine that has both: words, and reals by the
// word-to-real rule, bit for bit on devices of several shapes, from any place, in any cut, with any
// number of calls in flight.
#include <algorithm>
#include <cstdint>
#include <limits>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "device_engines.hpp"
#include "drawing.hpp"
#include "frame/rows.hpp"
#include "in_flight.hpp"
#include "message.hpp"
#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using rng::detail::engine_row;
using tarn_test::cpu_queue;
using tarn_test::draw;
using tarn_test::draw_into_buffer;
using tarn_test::gpu_queue;
using tarn_test::gpu_queues;
using words = std::vector<std::uint32_t>;

constexpr std::uint32_t seed = 20211;

template <typename Engine>
class engine_road : public testing::Test {
 protected:
  /// 32-bit values that a word takes in the output of `bits`.
  static constexpr auto stored = static_cast<std::size_t>(engine_row<Engine>::stored_words);

  static Engine at(const sycl::queue& queue, std::uint64_t first) {
    Engine engine(queue, seed);
    rng::skip_ahead(engine, first);
    return engine;
  }
  static words draw_words(Engine& engine, std::int64_t n) {
    return draw(rng::bits<>(), engine, n, stored);
  }

  /// The words that follow word `first`, by the host road.
  static words host_words(std::uint64_t first, std::int64_t n) {
    Engine engine = at(cpu_queue(), first);
    return draw_words(engine, n);
  }
  /// `n` words of a longer run, from word `first` of it on.
  static words part(const words& run, std::int64_t first, std::int64_t n) {
    const auto begin = run.begin() + first * static_cast<std::int64_t>(stored);
    return words(begin, begin + n * static_cast<std::int64_t>(stored));
  }

  /// One distribution on every GPU against the host, in both output forms.
  template <typename Distr>
  static void expect_same(const Distr& distr) {
    for (const std::uint64_t first : {0u, 3u}) {
      for (const std::int64_t n : {1, 5, 64, 1023, 4099}) {
        Engine host = at(cpu_queue(), first);
        const auto expected = draw(distr, host, n);
        for (const sycl::queue& queue : gpu_queues()) {
          Engine engine = at(queue, first);
          Engine same = at(queue, first);
          ASSERT_EQ(draw(distr, engine, n), expected) << "n " << n;
          ASSERT_EQ(draw_into_buffer(distr, same, n), expected) << "buffer, n " << n;
        }
      }
    }
  }

  /// Every way to cut 24 results into three calls, against one call.
  template <typename Distr>
  static void expect_cuts_to_agree(const Distr& distr) {
    constexpr std::int64_t total = 24;
    Engine whole_engine = at(gpu_queue(), 1);
    const auto whole = draw(distr, whole_engine, total);
    for (std::int64_t first = 0; first <= total; ++first) {
      for (std::int64_t second = 0; first + second <= total; ++second) {
        Engine engine = at(gpu_queue(), 1);
        auto values = draw(distr, engine, first);
        for (const std::int64_t n : {second, total - first - second}) {
          const auto more = draw(distr, engine, n);
          values.insert(values.end(), more.begin(), more.end());
        }
        ASSERT_EQ(values, whole) << first << " + " << second << " + rest";
      }
    }
  }
};
TYPED_TEST_SUITE(engine_road, tarn_test::device_engines, tarn_test::engine_name);
TARN_REPORTS_CUDA(engine_road)

TYPED_TEST(engine_road, every_count_from_several_places) {
  constexpr std::int64_t most = 300;
  const auto queues = gpu_queues();
  ASSERT_GE(queues.size(), 3u);
  for (const std::uint64_t first : {0u, 1u, 2u, 3u, 7u}) {
    const words run = this->host_words(first, most + 3);
    for (std::int64_t n = 0; n <= most; ++n) {
      // Every count on one device or another.
      TypeParam engine = this->at(queues[static_cast<std::size_t>(n) % queues.size()], first);
      ASSERT_EQ(this->draw_words(engine, n), this->part(run, 0, n)) << n << " from " << first;
      ASSERT_EQ(this->draw_words(engine, 3), this->part(run, n, 3)) << "after " << n;
    }
  }
}

// Chunks and work-groups of every family of kernels end at multiples of these.
TYPED_TEST(engine_road, counts_around_chunks_and_groups) {
  const words run = this->host_words(5, 300001);
  for (const sycl::queue& queue : gpu_queues()) {
    for (const std::int64_t n :
         {4095, 4096, 4097, 8191, 8192, 8193, 65535, 65536, 65537, 131073, 300001}) {
      TypeParam engine = this->at(queue, 5);
      ASSERT_TRUE(this->draw_words(engine, n) == this->part(run, 0, n)) << n;
    }
  }
}

TYPED_TEST(engine_road, far_places) {
  for (const std::uint64_t first :
       {std::uint64_t{1} << 31, (std::uint64_t{1} << 32) - 2, (std::uint64_t{1} << 62) + 1}) {
    TypeParam engine = this->at(gpu_queue(), first);
    ASSERT_EQ(this->draw_words(engine, 100), this->host_words(first, 100)) << first;
  }
}

TYPED_TEST(engine_road, reals_have_the_same_bits) {
  using accurate = rng::uniform_method::accurate;
  this->expect_same(rng::uniform<float>());
  this->expect_same(rng::uniform<float>(-1e30f, 3e30f));
  this->expect_same(rng::uniform<float>(-0.1f, 0.7f));
  this->expect_same(rng::uniform<float, accurate>(1.0f, 1.0000001f));
  this->expect_same(rng::uniform<double>(-0.1, 0.7));
  this->expect_same(rng::uniform<double, accurate>(5.0, 5.000001));
}

TYPED_TEST(engine_road, integers_have_the_same_bits) {
  using accurate = rng::uniform_method::accurate;
  this->expect_same(rng::uniform<std::int32_t>(-1000000000, 2000000000));
  this->expect_same(rng::uniform<std::int32_t>());
  // Without a sign, truncation and floor are the same, so these agree as well.
  this->expect_same(rng::uniform<std::uint32_t, accurate>(0, 4000000000u));
  this->expect_same(rng::uniform<std::int32_t, accurate>(0, 2000000000));
}

TYPED_TEST(engine_road, equidistributed_bits_are_the_same_or_refused) {
  if constexpr (engine_row<TypeParam>::uniform_bits) {
    this->expect_same(rng::uniform_bits<std::uint32_t>());
    this->expect_same(rng::uniform_bits<std::uint64_t>());
  } else {
    TypeParam engine(gpu_queue(), seed);
    std::uint64_t result = 7;
    EXPECT_EQ(tarn_test::message_of<kestrel::tarn::unimplemented>(
                  [&] { rng::generate(rng::uniform_bits<std::uint64_t>(), engine, -1, &result); }),
              std::string("kestrel::tarn::rng::generate: unimplemented functionality: uniform_bits "
                          "distribution and ") +
                  engine_row<TypeParam>::name + " engine combination");
    EXPECT_EQ(result, 7u);
  }
}

TYPED_TEST(engine_road, any_cut_of_a_call_gives_the_same_results) {
  this->expect_cuts_to_agree(rng::uniform<float>(-1.0f, 3.0f));
  this->expect_cuts_to_agree(rng::uniform<double>(-1.0, 3.0));
  this->expect_cuts_to_agree(rng::uniform<std::int32_t>(-50, 50));
  if constexpr (engine_row<TypeParam>::uniform_bits) {
    this->expect_cuts_to_agree(rng::uniform_bits<std::uint32_t>());
    this->expect_cuts_to_agree(rng::uniform_bits<std::uint64_t>());
  }
}

// The state moves when a call is submitted, not when its kernel runs.
TYPED_TEST(engine_road, two_hundred_calls_in_flight_give_consecutive_stretches) {
  constexpr std::int64_t calls = 200;
  constexpr std::int64_t n = 37;
  sycl::queue queue = gpu_queue();
  const std::size_t size = static_cast<std::size_t>(calls * n) * this->stored;
  auto* values = sycl::malloc_shared<std::uint32_t>(size, queue);
  std::fill(values, values + size, tarn_test::marker<std::uint32_t>());
  tarn_test::gate shut(queue);  // no kernel runs before all calls are made
  std::vector<sycl::event> events;
  {
    TypeParam engine(queue, seed);
    for (std::int64_t call = 0; call < calls; ++call) {
      std::uint32_t* stretch = values + static_cast<std::size_t>(call * n) * this->stored;
      events.push_back(rng::generate(rng::bits<>(), engine, n, stretch, {shut.closed}));
    }
    EXPECT_TRUE(tarn_test::same_bits(values[0], tarn_test::marker<std::uint32_t>()));
    shut.open();
  }  // the engine may go before its kernels run
  sycl::event::wait(events);
  EXPECT_TRUE(words(values, values + size) == this->host_words(0, calls * n));
  sycl::free(values, queue);
}

template <typename Engine>
std::string refusal_of_range(Engine& engine, std::int64_t n, std::uint32_t* r) {
  return tarn_test::message_of<sycl::exception>(
      [&] { rng::generate(rng::bits<>(), engine, n, r); });
}

// Words of mcg59 fill two values each: the doubled count must not wrap into a small one.
TEST(engine_road_of_mcg59, counts_past_the_range_of_a_kernel_are_refused) {
  rng::mcg59 engine(gpu_queue());
  std::uint32_t value = 7;
  for (const std::int64_t n :
       {std::int64_t{1} << 33, std::int64_t{1} << 62, std::numeric_limits<std::int64_t>::max()}) {
    EXPECT_EQ(refusal_of_range(engine, n, &value),
              "Provided range is out of integer limits. Pass `-fno-sycl-id-queries-fit-in-int' to "
              "disable range check.")
        << n;
  }
  EXPECT_EQ(value, 7u);
}

TEST(engine_road_of_mcg59, an_odd_count_ends_in_a_half_filled_block) {
  rng::mcg59 engine(gpu_queue(), 3);
  rng::mcg59 host(cpu_queue(), 3);
  const words drawn = draw(rng::bits<>(), engine, 5, 2);  // guards behind value 10
  EXPECT_EQ(drawn, draw(rng::bits<>(), host, 5, 2));
  for (std::size_t i = 1; i < drawn.size(); i += 2) {
    EXPECT_LT(drawn[i], 1u << 27);  // bits 32 to 58
  }
  EXPECT_EQ(draw(rng::bits<>(), engine, 2, 2), draw(rng::bits<>(), host, 2, 2));
}

/// The engines that can be split, on both roads: every stride-th word.
template <typename Engine>
void expect_split_words(std::uint64_t idx, std::uint64_t stride) {
  constexpr auto stored = static_cast<std::size_t>(engine_row<Engine>::stored_words);
  Engine host(cpu_queue(), seed);
  Engine engine(gpu_queue(), seed);
  rng::leapfrog(host, idx, stride);
  rng::leapfrog(engine, idx, stride);
  ASSERT_EQ(draw(rng::bits<>(), engine, 77, stored), draw(rng::bits<>(), host, 77, stored));
  rng::skip_ahead(host, 12345);
  rng::skip_ahead(engine, 12345);
  ASSERT_EQ(draw(rng::bits<>(), engine, 9, stored), draw(rng::bits<>(), host, 9, stored));
}

TEST(engine_road_of_congruential_engines, split_sequences_are_the_same) {
  for (const std::uint64_t stride : {1u, 2u, 7u, 1000003u}) {
    expect_split_words<rng::mcg31m1>(stride - 1, stride);
    expect_split_words<rng::mcg59>(stride - 1, stride);
  }
}

}  // namespace
