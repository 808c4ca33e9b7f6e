// SPDX-License-Identifier: Apache-2.0
// mt19937 on GPUs of several shapes against the serial sequence of the host: at every bound of the
// plan that shares a call among work-groups, in any cut, one value or a pair at a time, from any
// place of a stream's block.
#include <algorithm>
#include <cstdint>
#include <cstring>
#include <initializer_list>
#include <random>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <kestrel/tarn/rng/device_level.hpp>

#include <gtest/gtest.h>

#include "device_engines.hpp"
#include "distributions/box_muller.hpp"
#include "drawing.hpp"
#include "engines/mt19937.hpp"
#include "every_engine.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace detail = rng::detail;
using rng::mt19937;
using tarn_test::cpu_queue;
using tarn_test::draw;
using tarn_test::gpu_queue;
using tarn_test::gpu_queues;
using tarn_test::same_reals;
using words = std::vector<std::uint32_t>;

constexpr std::uint32_t seed = 20211;
constexpr std::int64_t round = 224;       // words of a group at a time
constexpr std::int64_t sweep = 32 * 224;  // of all groups

template <typename Distr>
auto host_values(const Distr& distr, std::int64_t n) {
  mt19937 host(cpu_queue(), seed);
  return draw(distr, host, n);
}

/// The first words of the sequence.
const words& serial() {
  static const words run = host_values(rng::bits<>(), 60000);
  return run;
}
words part(std::int64_t first, std::int64_t n) {
  return words(serial().begin() + first, serial().begin() + first + n);
}
words next(mt19937& engine, std::int64_t n) {
  return draw(rng::bits<>(), engine, n);
}

/// Counts next to the bounds of rounds and sweeps, and all small ones.
std::vector<std::int64_t> counts() {
  std::vector<std::int64_t> all;
  for (std::int64_t n = 0; n <= 300; ++n) {
    all.push_back(n);
  }
  for (const std::int64_t bound : {2 * round, 3 * round, 31 * round, sweep, sweep + round,
                                   sweep + 2 * round, 2 * sweep, 3 * sweep + 17 * round}) {
    for (std::int64_t n = bound - 2; n <= bound + 2; ++n) {
      all.push_back(n);
    }
  }
  return all;
}

TEST(mt19937_plan, makes_a_remainder_of_one_round_as_a_tail) {
  const auto plan = [](std::uint64_t n) {
    const auto made = detail::twister_plan_of<detail::mt19937_shape>(n, 32);
    return std::vector<std::uint64_t>{made.rounds, made.more, made.tail};
  };
  using plan_type = std::vector<std::uint64_t>;
  EXPECT_EQ(plan(0), (plan_type{0, 0, 0}));
  EXPECT_EQ(plan(223), (plan_type{0, 0, 223}));
  EXPECT_EQ(plan(224), (plan_type{0, 0, 224}));
  EXPECT_EQ(plan(225), (plan_type{0, 1, 1}));
  EXPECT_EQ(plan(448), (plan_type{0, 2, 0}));
  EXPECT_EQ(plan(7167), (plan_type{0, 31, 223}));
  EXPECT_EQ(plan(7168), (plan_type{1, 0, 0}));
  EXPECT_EQ(plan(7168 + 224), (plan_type{1, 0, 224}));
  EXPECT_EQ(plan(7168 + 225), (plan_type{1, 1, 1}));
}

TARN_REPORTS_CUDA(mt19937_road)

TEST(mt19937_road, has_the_words_of_the_host_at_every_bound_of_the_plan) {
  const auto queues = gpu_queues();
  ASSERT_GE(queues.size(), 3u);
  std::size_t turn = 0;
  for (const std::int64_t n : counts()) {
    mt19937 engine(queues[turn++ % queues.size()], seed);
    ASSERT_EQ(next(engine, n), part(0, n)) << n;
    ASSERT_EQ(next(engine, 7), part(n, 7)) << "after " << n;
    ASSERT_EQ(next(engine, 700), part(n + 7, 700)) << "after " << n;
  }
}

TEST(mt19937_road, has_the_words_of_the_host_in_any_cut) {
  std::mt19937 random(5);
  for (const sycl::queue& queue : gpu_queues()) {
    for (int trial = 0; trial < 8; ++trial) {
      mt19937 engine(queue, seed);
      std::int64_t place = 0;
      const int calls = 1 + static_cast<int>(random() % 20);
      for (int call = 0; call < calls; ++call) {
        const auto n = static_cast<std::int64_t>(random() % (call % 3 == 0 ? 8000 : 500));
        SCOPED_TRACE(std::to_string(n) + " from " + std::to_string(place));
        const bool into_buffer = random() % 2 == 0;
        ASSERT_EQ(
            into_buffer ? tarn_test::draw_into_buffer(rng::bits<>(), engine, n) : next(engine, n),
            part(place, n));
        place += n;
      }
    }
  }
}

TEST(mt19937_road, has_the_words_of_a_list_seed) {
  for (const auto& list :
       {std::initializer_list<std::uint32_t>{}, {5u}, {0x123u, 0x234u, 0x345u, 0x456u}}) {
    mt19937 host(cpu_queue(), list);
    mt19937 engine(gpu_queue(), list);
    EXPECT_EQ(next(engine, 1000), next(host, 1000)) << list.size();
  }
}

template <typename Distr>
void expect_same_bits(const Distr& distr) {
  for (const std::int64_t n : {1, 5, 224, 225, 1023, 7171}) {
    mt19937 engine(gpu_queue(), seed);
    mt19937 same(gpu_queue(), seed);
    const auto expected = host_values(distr, n);
    ASSERT_EQ(draw(distr, engine, n), expected) << n;
    ASSERT_EQ(tarn_test::draw_into_buffer(distr, same, n), expected) << "buffer, " << n;
  }
}

TEST(mt19937_road, has_the_reals_of_the_host) {
  using accurate = rng::uniform_method::accurate;
  expect_same_bits(rng::uniform<float>());
  expect_same_bits(rng::uniform<float>(-0.1f, 0.7f));
  expect_same_bits(rng::uniform<float, accurate>(1.0f, 1.0000001f));
  expect_same_bits(rng::uniform<double>(-0.1, 0.7));
  expect_same_bits(rng::uniform<double, accurate>(5.0, 5.000001));
  expect_same_bits(rng::uniform<std::int32_t>(-1000000000, 2000000000));
  expect_same_bits(rng::uniform<std::int32_t, accurate>(0, 2000000000));
  expect_same_bits(rng::uniform<std::uint32_t, accurate>(0, 4000000000u));
  expect_same_bits(rng::uniform_bits<std::uint32_t>());
  expect_same_bits(rng::gaussian<float, rng::gaussian_method::icdf>(1.0f, 2.0f));
  expect_same_bits(rng::gaussian<double, rng::gaussian_method::icdf>(1.0, 2.0));
}

/// The results of n / pair_results pairs, and of one more of which a part is kept, out of the reals
/// of the host; at `first` words into the sequence.
template <typename R, typename Functor>
std::vector<R> pairs_of_host(const Functor& functor, std::int64_t first, std::int64_t n) {
  constexpr std::int64_t results = Functor::pair_results;
  mt19937 host(cpu_queue(), seed);
  rng::skip_ahead(host, static_cast<std::uint64_t>(first));
  const std::vector<R> reals = draw(rng::uniform<R>(), host, 2 * ((n + results - 1) / results));
  std::vector<R> expected;
  for (std::size_t i = 0; i < reals.size(); i += 2) {
    R out[results];
    functor.pair(reals[i], reals[i + 1], out);
    expected.insert(expected.end(), out, out + results);
  }
  expected.resize(static_cast<std::size_t>(n));
  return expected;
}

const std::vector<std::int64_t> pair_counts = {0,    1,    2,    3,    111,  112,  113,  223,
                                               224,  225,  226,  447,  448,  449,  673,  3583,
                                               3584, 3585, 7167, 7168, 7169, 7391, 7393, 14337};

TEST(mt19937_pairs, of_two_results_follow_the_sequence) {
  const detail::gpu::gaussian_box_muller2<double> functor{1.0, 2.0};
  const rng::gaussian<double, rng::gaussian_method::box_muller2> normal(1.0, 2.0);
  for (const std::int64_t n : pair_counts) {
    SCOPED_TRACE(n);
    mt19937 engine(gpu_queue(), seed);
    EXPECT_TRUE(same_reals(engine.get_queue(), draw(normal, engine, n),
                           pairs_of_host<double>(functor, 0, n)));
    // An odd count takes a word that is not counted.
    ASSERT_EQ(next(engine, 3), part(n, 3));
  }
}

TEST(mt19937_pairs, of_one_result_follow_the_sequence) {
  const detail::gpu::gaussian_box_muller<float> functor{1.0f, 2.0f};
  const rng::gaussian<float, rng::gaussian_method::box_muller> normal(1.0f, 2.0f);
  for (const std::int64_t n : pair_counts) {
    SCOPED_TRACE(n);
    mt19937 engine(gpu_queue(), seed);
    EXPECT_TRUE(same_reals(engine.get_queue(), draw(normal, engine, n),
                           pairs_of_host<float>(functor, 0, n)));
    ASSERT_EQ(next(engine, 3), part(2 * n, 3));
  }
}

TEST(mt19937_pairs, of_words_are_those_of_the_host) {
  const rng::uniform_bits<std::uint64_t> bits;
  for (const std::int64_t n : pair_counts) {
    SCOPED_TRACE(n);
    mt19937 engine(gpu_queue(), seed);
    EXPECT_TRUE(draw(bits, engine, n) == host_values(bits, n));
    ASSERT_EQ(next(engine, 3), part(2 * n, 3));
  }
}

TEST(mt19937_pairs, of_odd_calls_begin_where_the_count_says) {
  std::mt19937 random(6);
  const detail::gpu::gaussian_box_muller2<double> functor{0.0, 1.0};
  const rng::gaussian<double, rng::gaussian_method::box_muller2> normal;
  mt19937 engine(gpu_queue(), seed);
  std::int64_t place = 0;
  for (int call = 0; call < 20; ++call) {
    const auto n = static_cast<std::int64_t>(random() % 900) * 2 + 1;
    SCOPED_TRACE(std::to_string(n) + " from " + std::to_string(place));
    ASSERT_TRUE(same_reals(engine.get_queue(), draw(normal, engine, n),
                           pairs_of_host<double>(functor, place, n)));
    place += n;
  }
}

/// Places of a stream inside its block of 624 words, and in the next one.
const std::vector<std::int64_t> places = {0,   1,   2,   223, 224, 226, 227, 228,
                                          396, 397, 398, 622, 623, 624, 625, 1000};

TEST(mt19937_in_mid_block, goes_on_from_a_loaded_state) {
  const rng::uniform_bits<std::uint64_t> bits;
  for (const std::int64_t place : places) {
    SCOPED_TRACE(place);
    mt19937 host(cpu_queue(), seed);
    next(host, place);
    const tarn_test::image saved = tarn_test::image_of(host);
    for (const std::int64_t n : {1, 225, 700, 7169}) {
      auto engine = rng::load_state<mt19937>(gpu_queue(), saved.data());
      ASSERT_EQ(next(engine, n), part(place, n)) << n;
      ASSERT_EQ(next(engine, 700), part(place + n, 700)) << "after " << n;
    }
    auto engine = rng::load_state<mt19937>(gpu_queue(), saved.data());
    ASSERT_EQ(draw(bits, engine, 800), draw(bits, host, 800));
    ASSERT_EQ(draw(rng::uniform<float>(), engine, 800), draw(rng::uniform<float>(), host, 800));
  }
}

/// Draws `n` words at the GPU level, deletes the engine.
words words_of(sycl::queue& queue, detail::engine_base_impl<mt19937>* engine, std::size_t n) {
  auto* values = sycl::malloc_shared<std::uint32_t>(n, queue);
  std::fill_n(values, n, tarn_test::marker<std::uint32_t>());
  detail::gpu::generate<mt19937, rng::bits<>>(queue, rng::bits<>(), engine,
                                              static_cast<std::int64_t>(n), values, {})
      .wait();
  const words drawn(values, values + n);
  sycl::free(values, queue);
  detail::gpu::delete_engine(queue, engine);
  return drawn;
}

TEST(mt19937_in_mid_block, goes_on_from_a_stream) {
  sycl::queue queue = gpu_queue();
  for (const std::int64_t place : places) {
    SCOPED_TRACE(place);
    const tarn_test::plain_stream stream(RVX_BRNG_MT19937, seed);
    ASSERT_EQ(rvxSkipAheadStream(stream, place), 0);
    auto* engine = detail::gpu::create_engine<mt19937>(queue, static_cast<rvx_stream>(stream));
    ASSERT_EQ(words_of(queue, engine, 1500), part(place, 1500));
    // The stream stays its owner's, where it was.
    auto* again = detail::gpu::create_engine<mt19937>(queue, static_cast<rvx_stream>(stream));
    ASSERT_EQ(words_of(queue, again, 9), part(place, 9));
  }
}

// Position 0 says the same as 624: no word of the block has been delivered.
TEST(mt19937_in_mid_block, reads_position_0_as_a_whole_block) {
  sycl::queue queue = gpu_queue();
  const tarn_test::plain_stream stream(RVX_BRNG_MT19937, seed);
  auto* bytes = static_cast<unsigned char*>(static_cast<rvx_stream>(stream));
  std::uint32_t position = 0;
  std::memcpy(&position, bytes + 2512, sizeof position);
  ASSERT_EQ(position, 624u);
  position = 0;
  std::memcpy(bytes + 2512, &position, sizeof position);
  auto* engine = detail::gpu::create_engine<mt19937>(queue, static_cast<rvx_stream>(stream));
  EXPECT_EQ(words_of(queue, engine, 1500), part(0, 1500));
}

TEST(mt19937_level, makes_engines_of_each_kind_of_seed) {
  namespace gpu = detail::gpu;
  sycl::queue queue = gpu_queue();
  EXPECT_EQ(words_of(queue, gpu::create_engine<mt19937>(queue, std::uint64_t{seed}), 900),
            part(0, 900));
  const std::uint32_t list[] = {5, 6, 7};
  mt19937 host(cpu_queue(), {5, 6, 7});
  EXPECT_EQ(words_of(queue, gpu::create_engine<mt19937>(queue, 3, list), 900), next(host, 900));
  auto* source = gpu::create_engine<mt19937>(queue, std::uint64_t{seed});
  gpu::skip_ahead<mt19937>(queue, source, 1234);
  auto* copy = gpu::create_engine<mt19937>(queue, source);
  EXPECT_EQ(words_of(queue, copy, 900), part(1234, 900));
  EXPECT_EQ(words_of(queue, source, 900), part(1234, 900));
}

}  // namespace
