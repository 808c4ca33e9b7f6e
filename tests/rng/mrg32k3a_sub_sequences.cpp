// SPDX-License-Identifier: Apache-2.0
// The sub-sequence modes of mrg32k3a against a serial model, on devices of several shapes.
#include <cstdint>
#include <initializer_list>
#include <random>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "device_engines.hpp"
#include "drawing.hpp"
#include "mrg32k3a_round.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using rng::mrg32k3a;
using rng::mrg32k3a_mode::custom;
using rng::mrg32k3a_mode::optimal;
using tarn_test::draw;
using tarn_test::draw_into_buffer;
using tarn_test::gpu_queue;
using tarn_test::gpu_queues;
using tarn_test::mrg32k3a_round;

constexpr std::uint32_t optimal_count = 40960;
const rng::uniform<double> reals(-1.0, 3.0);

/// An engine and its model, `count` sub-sequences each.
struct pair_of {
  explicit pair_of(std::uint32_t count, const sycl::queue& queue = gpu_queue())
      : engine(queue, 7, custom(count)), model({7}, count) {}

  template <typename Distr>
  void expect_same(const Distr& distr, std::int64_t n) {
    const auto expected = model.draw(distr, static_cast<std::uint64_t>(n));
    if constexpr (std::is_same_v<Distr, rng::gaussian<typename Distr::result_type,
                                                      typename Distr::method_type>>) {
      ASSERT_TRUE(tarn_test::same_reals(engine.get_queue(), draw(distr, engine, n), expected)) << n;
    } else {
      ASSERT_EQ(draw(distr, engine, n), expected) << n;
    }
  }
  void expect_same(std::int64_t n) { expect_same(reals, n); }
  void skip(std::uint64_t n) {
    rng::skip_ahead(engine, n);
    model.skip(n);
  }

  mrg32k3a engine;
  mrg32k3a_round model;
};

TARN_REPORTS_CUDA(mrg32k3a_sub_sequences)

TEST(mrg32k3a_sub_sequences, random_calls_and_skips_are_dealt_out_in_turn) {
  std::mt19937 random(3);
  for (const sycl::queue& queue : gpu_queues()) {
    for (const std::uint32_t count : {1u, 2u, 3u, 7u, 1000u}) {
      pair_of both(count, queue);
      for (int call = 0; call < 40; ++call) {
        SCOPED_TRACE(std::to_string(count) + ", call " + std::to_string(call));
        const bool within_a_round = random() % 2 == 0;
        const auto n =
            static_cast<std::int64_t>(random() % (within_a_round ? count + 3 : 4 * count));
        if (random() % 4 == 0) {
          both.skip(static_cast<std::uint64_t>(n));
        } else {
          both.expect_same(n);
        }
        if (HasFatalFailure()) {
          return;
        }
      }
    }
  }
}

/// A call of `n` from place `position` in a round of seven, and what follows it.
void expect_call(std::int64_t position, std::int64_t n) {
  SCOPED_TRACE(std::to_string(n) + " from " + std::to_string(position));
  pair_of both(7);
  both.expect_same(position);
  both.expect_same(n);
  both.expect_same(20);
}

TEST(mrg32k3a_sub_sequences, two_results_from_place_3_are_of_items_3_and_4) {
  expect_call(3, 2);
}

TEST(mrg32k3a_sub_sequences, calls_that_end_before_the_round_does) {
  expect_call(0, 6);
  expect_call(3, 3);
  expect_call(6, 0);
}

TEST(mrg32k3a_sub_sequences, calls_that_end_with_the_round) {
  expect_call(0, 7);
  expect_call(3, 4);
  expect_call(6, 1);
}

TEST(mrg32k3a_sub_sequences, calls_that_end_after_the_round) {
  expect_call(0, 8);
  expect_call(3, 5);
  expect_call(6, 2);
}

TEST(mrg32k3a_sub_sequences, calls_of_as_many_results_as_their_place) {
  expect_call(4, 4);
  expect_call(5, 5);
  expect_call(6, 6);
}

TEST(mrg32k3a_sub_sequences, whole_rounds_leave_the_place) {
  for (const std::int64_t rounds : {1, 2, 5}) {
    expect_call(0, 7 * rounds);
    expect_call(4, 7 * rounds);
  }
}

TEST(mrg32k3a_sub_sequences, every_place_with_every_count) {
  for (std::int64_t position = 0; position < 7; ++position) {
    for (std::int64_t n = 0; n < 30; ++n) {
      expect_call(position, n);
      if (HasFatalFailure()) {
        return;
      }
    }
  }
}

// After three results of a round of seven and a skip by two, generators 3 and 4 are a word ahead,
// but it is still number 3 that is next.
TEST(mrg32k3a_sub_sequences, a_skip_does_not_turn_the_round) {
  pair_of skipped(7);
  pair_of drawn(7);
  skipped.expect_same(3);
  drawn.expect_same(3);
  skipped.skip(2);
  const auto passed = draw(reals, drawn.engine, 2);
  const auto after_drawing = draw(reals, drawn.engine, 7);  // of generators 5, 6, 0, ..., 4
  auto after_skipping = skipped.model.draw(reals, 7);       // of generators 3, 4, ..., 2
  EXPECT_EQ(draw(reals, skipped.engine, 7), after_skipping);
  EXPECT_NE(passed[0], after_skipping[0]);
  EXPECT_EQ(after_skipping[0], after_drawing[5]);
  EXPECT_EQ(after_skipping[2], after_drawing[0]);
}

TEST(mrg32k3a_sub_sequences, skips_of_any_length) {
  for (const std::uint32_t count : {1u, 2u, 3u}) {
    for (const std::uint64_t n :
         {std::uint64_t{1} << 62, (std::uint64_t{1} << 63) - 1, std::uint64_t{1} << 63,
          ~std::uint64_t{0} - 1, ~std::uint64_t{0}}) {
      SCOPED_TRACE(std::to_string(n) + " with " + std::to_string(count));
      pair_of both(count);
      both.expect_same(count - 1);
      both.skip(n);
      both.expect_same(9);
    }
  }
}

// Of pairs the first result is the sine's; a generator that has an odd count of results to give
// makes a pair for the last one, keeps its sine, and goes on with the word behind the pair's first.
template <typename Method>
void expect_gaussians() {
  for (const std::int64_t n : {1, 6, 7, 8, 13, 14, 15, 21, 29, 36, 100}) {
    SCOPED_TRACE(n);
    pair_of both(7);
    both.expect_same(rng::gaussian<float, Method>(1.0f, 2.0f), n);
    both.expect_same(rng::gaussian<double, Method>(-1.0, 0.5), n);
    both.expect_same(n);
  }
}

TEST(mrg32k3a_sub_sequences, gaussians_of_every_method) {
  expect_gaussians<rng::gaussian_method::icdf>();
  expect_gaussians<rng::gaussian_method::box_muller>();
  expect_gaussians<rng::gaussian_method::box_muller2>();
}

TEST(mrg32k3a_sub_sequences, an_odd_count_of_a_pair_method_drops_the_cosine) {
  const rng::gaussian<double, rng::gaussian_method::box_muller2> normal;
  mrg32k3a odd(gpu_queue(), 7, custom(1));
  mrg32k3a even(gpu_queue(), 7, custom(1));
  const double sine = draw(normal, odd, 1)[0];
  const auto both = draw(normal, even, 2);
  EXPECT_EQ(sine, both[0]);
  EXPECT_NE(both[0], both[1]);
  mrg32k3a serial(gpu_queue(), 7);
  const auto words = draw(reals, serial, 3);
  EXPECT_EQ(draw(reals, odd, 1)[0], words[1]);
  EXPECT_EQ(draw(reals, even, 1)[0], words[2]);
}

TEST(mrg32k3a_sub_sequences, uniforms_of_every_type) {
  using accurate = rng::uniform_method::accurate;
  pair_of both(7);
  both.expect_same(rng::uniform<float>(-1.0f, 3.0f), 40);
  both.expect_same(rng::uniform<float, accurate>(-1.0f, 3.0f), 41);
  both.expect_same(rng::uniform<double, accurate>(-1.0, 3.0), 42);
  both.expect_same(rng::uniform<std::int32_t>(-1000000000, 1000000000), 43);
  both.expect_same(rng::uniform<std::int32_t, accurate>(-1000000000, 1000000000), 44);
  both.expect_same(rng::uniform<std::uint32_t>(0, 4000000000u), 45);
  both.expect_same(rng::uniform<std::uint32_t, accurate>(0, 4000000000u), 46);
}

TEST(mrg32k3a_sub_sequences, of_a_single_one_are_the_serial_sequence) {
  mrg32k3a serial(tarn_test::cpu_queue(), 7);
  mrg32k3a single(gpu_queue(), 7, custom(1));
  for (const std::int64_t n : {1, 2, 5, 1000}) {
    EXPECT_EQ(draw(reals, single, n), draw(reals, serial, n)) << n;
  }
}

TEST(mrg32k3a_sub_sequences, are_40960_in_the_optimal_mode) {
  mrg32k3a engine(gpu_queue(), {7, 8, 9, 10}, optimal());
  mrg32k3a same(gpu_queue(), {7, 8, 9, 10}, custom(optimal_count));
  mrg32k3a_round model({7, 8, 9, 10}, optimal_count);
  for (const std::int64_t n : {30000, 30000, 100000, 3}) {
    const auto expected = model.draw(reals, static_cast<std::uint64_t>(n));
    EXPECT_TRUE(draw(reals, engine, n) == expected) << n;
    EXPECT_TRUE(draw(reals, same, n) == expected) << n;
  }
  rng::skip_ahead(engine, 50000);
  model.skip(50000);
  EXPECT_TRUE(draw(reals, engine, 50000) == model.draw(reals, 50000));
}

// It draws like the optimal mode, but a skip finds no sub-sequence to move.
TEST(mrg32k3a_sub_sequences, of_a_count_of_0) {
  mrg32k3a engine(gpu_queue(), 7, custom(0));
  mrg32k3a_round model({7}, optimal_count);
  EXPECT_TRUE(draw(reals, engine, 50000) == model.draw(reals, 50000));
  rng::skip_ahead(engine, 12345);
  mrg32k3a copy(engine);
  const auto expected = model.draw(reals, 50000);
  EXPECT_TRUE(draw(reals, engine, 50000) == expected);
  EXPECT_TRUE(draw(reals, copy, 50000) == expected);
}

TEST(mrg32k3a_sub_sequences, of_a_list_seed) {
  const std::initializer_list<std::uint32_t> none = {}, one = {5}, all = {5, 6, 7, 8, 9, 10};
  for (const auto& seed : {none, one, all}) {
    mrg32k3a engine(gpu_queue(), seed, custom(7));
    mrg32k3a_round model(seed, 7);
    EXPECT_EQ(draw(reals, engine, 50), model.draw(reals, 50)) << seed.size();
  }
}

TEST(mrg32k3a_sub_sequences, fill_buffers_and_follow_dependencies) {
  pair_of both(7);
  EXPECT_EQ(draw_into_buffer(reals, both.engine, 33), both.model.draw(reals, 33));
  // Two calls in a queue without an order of its own: the second goes by the event of the first.
  constexpr std::size_t n = 500;
  sycl::queue& queue = both.engine.get_queue();
  auto* values = sycl::malloc_shared<double>(2 * n, queue);
  sycl::event event = queue.fill(values, tarn_test::marker<double>(), 2 * n);
  event = rng::generate(reals, both.engine, n, values, {event});
  event = rng::generate(reals, both.engine, n, values + n, {event});
  event.wait();
  EXPECT_EQ(std::vector<double>(values, values + 2 * n), both.model.draw(reals, 2 * n));
  sycl::free(values, queue);
}

}  // namespace
