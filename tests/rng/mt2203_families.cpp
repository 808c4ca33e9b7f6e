// SPDX-License-Identifier: Apache-2.0
// mt2203 on GPUs of 3, 1 and 5 compute units against a serial model: every generator's run, the
// remainder, and the positions that stay behind.
#include <algorithm>
#include <cstdint>
#include <initializer_list>
#include <random>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "device_engines.hpp"
#include "distributions/box_muller.hpp"
#include "drawing.hpp"
#include "mt2203_model.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace detail = rng::detail;
using rng::mt2203;
using tarn_test::cpu_queue;
using tarn_test::draw;
using tarn_test::gpu_queues;
using tarn_test::mt2203_family;
using words = std::vector<std::uint32_t>;

constexpr std::uint32_t seed = 4711;

std::uint32_t units_of(const sycl::queue& queue) {
  return queue.get_device().get_info<sycl::info::device::max_compute_units>();
}

/// An engine and its model.
struct pair_of {
  explicit pair_of(const sycl::queue& queue)
      : engine(queue, seed), model(units_of(queue), std::uint64_t{seed}) {}

  void expect_same(std::int64_t n) {
    ASSERT_EQ(draw(rng::bits<>(), engine, n), model.draw(static_cast<std::uint64_t>(n))) << n;
  }

  mt2203 engine;
  mt2203_family model;
};

TARN_REPORTS_CUDA(mt2203_families)

TEST(mt2203_families, have_one_generator_for_each_compute_unit) {
  std::vector<std::uint32_t> units;
  for (const sycl::queue& queue : tarn_test::host_run_gpu_queues()) {
    units.push_back(units_of(queue));
  }
  EXPECT_EQ(units, (std::vector<std::uint32_t>{3, 1, 5}));
}

TEST(mt2203_families, of_every_count) {
  for (const sycl::queue& queue : gpu_queues()) {
    SCOPED_TRACE(units_of(queue));
    for (std::int64_t n = 0; n <= 700; ++n) {
      pair_of both(queue);
      both.expect_same(n);
      both.expect_same(40);
      both.expect_same(1000);
      if (HasFatalFailure()) {
        return;
      }
    }
  }
}

TEST(mt2203_families, in_any_cut) {
  std::mt19937 random(4);
  for (const sycl::queue& queue : gpu_queues()) {
    for (int trial = 0; trial < 20; ++trial) {
      pair_of both(queue);
      for (int call = 0; call < 20; ++call) {
        SCOPED_TRACE(std::to_string(units_of(queue)) + " units, call " + std::to_string(call));
        both.expect_same(static_cast<std::int64_t>(random() % (call % 2 == 0 ? 4000 : 200)));
        if (HasFatalFailure()) {
          return;
        }
      }
    }
  }
}

// Below 33 words the last generator makes all of them, and the others stand as before.
TEST(mt2203_families, of_few_words_are_the_last_generators) {
  for (const sycl::queue& queue : gpu_queues()) {
    const std::uint32_t last = units_of(queue) - 1;
    for (std::int64_t n = 0; n <= 32; ++n) {
      mt2203 engine(queue, seed);
      mt2203 alone(cpu_queue(), seed, last);
      EXPECT_EQ(draw(rng::bits<>(), engine, n), draw(rng::bits<>(), alone, n));
      EXPECT_EQ(draw(rng::bits<>(), engine, 7), draw(rng::bits<>(), alone, 7)) << "after " << n;
    }
  }
}

/// Calls of one round from each generator, and of the same with one word more from the last.
TEST(mt2203_families, leave_positions_behind_after_a_call_with_a_tail) {
  const sycl::queue queue = gpu_queues().front();
  const std::int64_t sweep = 32 * units_of(queue);
  ASSERT_EQ(sweep, 96);
  mt2203 whole(queue, seed);
  const words first = draw(rng::bits<>(), whole, sweep);
  const words second = draw(rng::bits<>(), whole, sweep);

  mt2203 tailed(queue, seed);
  const words with_tail = draw(rng::bits<>(), tailed, sweep + 1);
  EXPECT_TRUE(std::equal(first.begin(), first.end(), with_tail.begin()));
  EXPECT_EQ(with_tail[96], second[64]);  // of the last generator
  const words again = draw(rng::bits<>(), tailed, sweep);
  // The first two repeat their words; the last one goes on behind the word of the tail.
  EXPECT_TRUE(std::equal(first.begin(), first.begin() + 64, again.begin()));
  EXPECT_TRUE(std::equal(second.begin() + 65, second.end(), again.begin() + 64));
}

TEST(mt2203_families, depend_on_the_count_of_units) {
  std::vector<words> runs;
  for (const sycl::queue& queue : gpu_queues()) {
    mt2203 engine(queue, seed);
    runs.push_back(draw(rng::bits<>(), engine, 480));  // 480 = 32 * 3 * 5
  }
  EXPECT_NE(runs[0], runs[1]);
  EXPECT_NE(runs[1], runs[2]);
  EXPECT_NE(runs[0], runs[2]);
  mt2203 host(cpu_queue(), seed);
  EXPECT_EQ(runs[1], draw(rng::bits<>(), host, 480));  // a single generator is the serial sequence
  EXPECT_TRUE(std::equal(runs[1].begin(), runs[1].begin() + 160, runs[0].begin()));
}

TEST(mt2203_families, of_a_list_seed) {
  for (const sycl::queue& queue : gpu_queues()) {
    mt2203 engine(queue, {5, 6, 7});
    mt2203_family model(units_of(queue), words{5, 6, 7});
    EXPECT_EQ(draw(rng::bits<>(), engine, 1000), model.draw(1000));
    mt2203 by_default(queue);
    mt2203_family ones(units_of(queue), std::uint64_t{1});
    EXPECT_EQ(draw(rng::bits<>(), by_default, 1000), ones.draw(1000));
  }
}

TEST(mt2203_families, of_words_in_pairs) {
  for (const sycl::queue& queue : gpu_queues()) {
    for (const std::int64_t n : {0, 1, 15, 16, 17, 31, 33, 47, 48, 49, 80, 239, 240, 241, 1000}) {
      SCOPED_TRACE(n);
      pair_of both(queue);
      const words drawn = both.model.draw(static_cast<std::uint64_t>(2 * n));
      std::vector<std::uint64_t> expected;
      for (std::size_t i = 0; i < drawn.size(); i += 2) {
        expected.push_back(drawn[i] + (std::uint64_t{drawn[i + 1]} << 32));
      }
      ASSERT_EQ(draw(rng::uniform_bits<std::uint64_t>(), both.engine, n), expected);
      both.expect_same(100);
    }
  }
}

// Of an odd count the last pair takes a word that is not counted.
TEST(mt2203_families, of_reals_in_pairs) {
  const detail::gpu::gaussian_box_muller2<double> functor{1.0, 2.0};
  const rng::gaussian<double, rng::gaussian_method::box_muller2> normal(1.0, 2.0);
  for (const sycl::queue& queue : gpu_queues()) {
    for (const std::int64_t n : {0, 1, 2, 3, 31, 32, 33, 35, 95, 96, 97, 129, 159, 161, 999}) {
      SCOPED_TRACE(n);
      pair_of both(queue);
      const auto count = static_cast<std::uint64_t>(n);
      const words drawn = both.model.draw(count, count % 2);
      std::vector<double> expected(drawn.size());
      for (std::size_t i = 0; i < drawn.size(); i += 2) {
        functor.pair(drawn[i] * 0x1p-32, drawn[i + 1] * 0x1p-32, &expected[i]);
      }
      expected.resize(count);
      ASSERT_TRUE(tarn_test::same_reals(queue, draw(normal, both.engine, n), expected));
      both.expect_same(100);
    }
  }
}

TEST(mt2203_families, of_reals) {
  for (const sycl::queue& queue : gpu_queues()) {
    pair_of both(queue);
    const words drawn = both.model.draw(1001);
    std::vector<double> doubles;
    std::vector<float> floats;
    for (const std::uint32_t word : drawn) {
      doubles.push_back(word * 0x1p-32);
      floats.push_back(static_cast<float>(word) * 0x1p-32f);
    }
    mt2203 same = mt2203(queue, seed);
    EXPECT_EQ(draw(rng::uniform<double>(), both.engine, 1001), doubles);
    EXPECT_EQ(tarn_test::draw_into_buffer(rng::uniform<float>(), same, 1001), floats);
  }
}

}  // namespace
