// SPDX-License-Identifier: Apache-2.0
// mt19937 on a GPU queue as an object with memory of its own: skips and what they leave alone,
// saved states on the way from road to road, copies, moves and ends with kernels in flight.
#include <cstdint>
#include <cstring>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "every_engine.hpp"
#include "in_flight.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using rng::mt19937;
using tarn_test::cpu_queue;
using tarn_test::draw;
using tarn_test::gate;
using tarn_test::gpu_queue;
using tarn_test::image;
using tarn_test::image_of;
using words = std::vector<std::uint32_t>;
using shared_words = tarn_test::results<std::uint32_t>;

constexpr std::uint32_t seed = 77;

words next(mt19937& engine, std::int64_t n) {
  return draw(rng::bits<>(), engine, n);
}
words serial(std::uint64_t first, std::int64_t n) {
  mt19937 host(cpu_queue(), seed);
  rng::skip_ahead(host, first);
  return next(host, n);
}
mt19937 on_gpu() {
  return mt19937(gpu_queue(), seed);
}

const std::vector<std::uint64_t> distances = {0,   1,   223, 224,  225,   447,
                                              448, 623, 624, 7168, 100003};

TEST(mt19937_skips, before_any_call_equal_drawing) {
  for (const std::uint64_t first : distances) {
    SCOPED_TRACE(first);
    mt19937 engine = on_gpu();
    rng::skip_ahead(engine, first);
    ASSERT_EQ(next(engine, 500), serial(first, 500));
    mt19937 twice = on_gpu();
    rng::skip_ahead(twice, first);
    rng::skip_ahead(twice, 225);
    ASSERT_EQ(next(twice, 500), serial(first + 225, 500));
  }
}

TEST(mt19937_skips, after_an_even_number_of_calls_equal_drawing) {
  for (const std::uint64_t distance : distances) {
    SCOPED_TRACE(distance);
    mt19937 engine = on_gpu();
    next(engine, 300);
    next(engine, 7);
    rng::skip_ahead(engine, distance);
    ASSERT_EQ(next(engine, 500), serial(307 + distance, 500));
  }
}

// The call reads the second half of the state, and the skip moves the first.
TEST(mt19937_skips, after_an_odd_number_of_calls_have_no_effect) {
  for (const std::uint64_t distance : distances) {
    SCOPED_TRACE(distance);
    mt19937 engine = on_gpu();
    next(engine, 300);
    rng::skip_ahead(engine, distance);
    ASSERT_EQ(next(engine, 500), serial(300, 500));
    // Nor later: the call has overwritten the half that was skipped.
    ASSERT_EQ(next(engine, 500), serial(800, 500));
    rng::skip_ahead(engine, distance);
    ASSERT_EQ(next(engine, 9), serial(1300, 9));
  }
}

TEST(mt19937_skips, count_calls_of_no_results_as_calls) {
  mt19937 engine = on_gpu();
  next(engine, 0);
  rng::skip_ahead(engine, 1000);
  EXPECT_EQ(next(engine, 9), serial(0, 9));
  rng::skip_ahead(engine, 1000);  // after two calls
  EXPECT_EQ(next(engine, 9), serial(1009, 9));
}

// A copy keeps which half is the next; a saved state does not.
TEST(mt19937_skips, of_copies_are_as_those_of_the_source) {
  mt19937 engine = on_gpu();
  next(engine, 300);
  mt19937 copy = engine;
  rng::skip_ahead(copy, 1000);
  EXPECT_EQ(next(copy, 9), serial(300, 9));
  const image saved = image_of(engine);
  auto loaded = rng::load_state<mt19937>(gpu_queue(), saved.data());
  rng::skip_ahead(loaded, 1000);
  EXPECT_EQ(next(loaded, 9), serial(1300, 9));
}

TEST(mt19937_skips, behind_the_words_of_a_view_equal_drawing) {
  mt19937 engine = on_gpu();
  next(engine, 300);
  {
    rng::bit_generator view(engine);
    EXPECT_EQ(view(), serial(300, 1)[0]);
  }
  rng::skip_ahead(engine, 1000);
  EXPECT_EQ(next(engine, 9), serial(1301, 9));
}

TEST(mt19937_skips, run_behind_the_calls_in_flight) {
  mt19937 engine = on_gpu();
  sycl::queue& queue = engine.get_queue();
  gate shut(queue);
  const shared_words first(queue, 300), second(queue, 300), third(queue, 300);
  rng::generate(rng::bits<>(), engine, 300, first.get(), {shut.closed});
  rng::generate(rng::bits<>(), engine, 300, second.get());
  rng::skip_ahead(engine, 1000);
  const sycl::event last = rng::generate(rng::bits<>(), engine, 300, third.get());
  EXPECT_EQ(third.values()[0], tarn_test::marker<std::uint32_t>());
  shut.open();
  sycl::event(last).wait();
  EXPECT_EQ(first.values(), serial(0, 300));
  EXPECT_EQ(second.values(), serial(300, 300));
  EXPECT_EQ(third.values(), serial(1600, 300));
}

std::uint32_t position_of(const image& saved) {
  std::uint32_t position = 0;
  std::memcpy(&position, saved.data() + 2512, sizeof position);
  return position;
}

TEST(mt19937_states, saved_on_a_gpu_are_whole_blocks) {
  std::mt19937 random(8);
  for (int trial = 0; trial < 40; ++trial) {
    mt19937 engine = on_gpu();
    std::uint64_t place = 0;
    for (int call = trial % 4; call > 0; --call) {
      const auto n = static_cast<std::int64_t>(random() % (trial % 3 == 0 ? 9000 : 700));
      next(engine, n);
      place += static_cast<std::uint64_t>(n);
    }
    SCOPED_TRACE(std::to_string(trial) + ", saved at " + std::to_string(place));
    const image saved = image_of(engine);
    ASSERT_EQ(position_of(saved), 624u);
    for (const sycl::queue& queue : {cpu_queue(), gpu_queue()}) {
      auto loaded = rng::load_state<mt19937>(queue, saved.data());
      ASSERT_EQ(next(loaded, 1300), serial(place, 1300));
    }
    ASSERT_EQ(next(engine, 1300), serial(place, 1300));  // saving moves nothing
  }
}

TEST(mt19937_states, saved_on_a_cpu_go_on_on_a_gpu_and_back) {
  std::mt19937 random(9);
  for (int trial = 0; trial < 40; ++trial) {
    const std::uint64_t place = random() % 2000;
    SCOPED_TRACE(place);
    mt19937 host(cpu_queue(), seed);
    rng::skip_ahead(host, place);
    const image saved = image_of(host);
    auto engine = rng::load_state<mt19937>(gpu_queue(), saved.data());
    const auto n = static_cast<std::int64_t>(random() % 500);
    ASSERT_EQ(next(engine, n), serial(place, n));
    const image again = image_of(engine);
    auto back = rng::load_state<mt19937>(cpu_queue(), again.data());
    ASSERT_EQ(next(back, 1300), serial(place + static_cast<std::uint64_t>(n), 1300));
  }
}

TEST(mt19937_states, are_saved_behind_the_calls_in_flight) {
  mt19937 engine = on_gpu();
  sycl::queue& queue = engine.get_queue();
  gate shut(queue);
  const shared_words drawn(queue, 300);
  rng::generate(rng::bits<>(), engine, 300, drawn.get(), {shut.closed});
  image saved;
  shut.open_during([&] { saved = image_of(engine); });
  EXPECT_EQ(drawn.values(), serial(0, 300));
  auto loaded = rng::load_state<mt19937>(cpu_queue(), saved.data());
  EXPECT_EQ(next(loaded, 900), serial(300, 900));
}

TEST(mt19937_copies, go_on_alone) {
  for (const int calls : {0, 1, 2, 3}) {
    mt19937 source = on_gpu();
    for (int call = 0; call < calls; ++call) {
      next(source, 100);
    }
    const auto place = static_cast<std::uint64_t>(100 * calls);
    mt19937 copy(source);
    mt19937 assigned(gpu_queue(), 3);
    next(assigned, 5);
    assigned = source;
    EXPECT_EQ(next(source, 800), serial(place, 800));
    EXPECT_EQ(next(copy, 8000), serial(place, 8000));
    EXPECT_EQ(next(assigned, 300), serial(place, 300));
    EXPECT_EQ(next(source, 9), serial(place + 800, 9));
  }
}

TEST(mt19937_copies, wait_for_the_calls_of_the_source) {
  mt19937 source = on_gpu();
  sycl::queue& queue = source.get_queue();
  gate shut(queue);
  const shared_words drawn(queue, 300);
  rng::generate(rng::bits<>(), source, 300, drawn.get(), {shut.closed});
  mt19937 copy(gpu_queue(), 3);
  shut.open_during([&] { copy = source; });
  EXPECT_EQ(drawn.values(), serial(0, 300));
  EXPECT_EQ(next(copy, 900), serial(300, 900));
  EXPECT_EQ(next(source, 900), serial(300, 900));
}

// The queue of an engine can be exchanged for one on a GPU; a copy is then made there.
TEST(mt19937_copies, of_an_engine_made_on_a_cpu_are_at_its_place) {
  mt19937 host(cpu_queue(), seed);
  next(host, 1001);
  host.get_queue() = gpu_queue();
  mt19937 copy(host);
  EXPECT_TRUE(copy.get_queue().get_device().is_gpu());
  EXPECT_EQ(next(copy, 900), serial(1001, 900));
}

TEST(mt19937_moves, leave_the_calls_in_flight_alone) {
  sycl::queue queue = gpu_queue();
  gate shut(queue);
  const shared_words drawn(queue, 300);
  mt19937 source(queue, seed);
  rng::generate(rng::bits<>(), source, 300, drawn.get(), {shut.closed});
  mt19937 target(std::move(source));
  EXPECT_EQ(drawn.values()[0], tarn_test::marker<std::uint32_t>());
  shut.open();
  EXPECT_EQ(next(target, 900), serial(300, 900));
  EXPECT_EQ(drawn.values(), serial(0, 300));
}

TEST(mt19937_ends, wait_for_the_calls_in_flight) {
  sycl::queue queue = gpu_queue();
  gate shut(queue);
  const shared_words drawn(queue, 600), other(queue, 300);
  shut.open_during([&] {
    mt19937 assigned(queue, seed);
    rng::generate(rng::bits<>(), assigned, 300, other.get(), {shut.closed});
    {
      mt19937 engine(queue, seed);
      rng::generate(rng::bits<>(), engine, 300, drawn.get(), {shut.closed});
      rng::generate(rng::bits<>(), engine, 300, drawn.get() + 300);
    }
    assigned = mt19937(queue, 3);
  });
  EXPECT_EQ(drawn.values(), serial(0, 600));
  EXPECT_EQ(other.values(), serial(0, 300));
}

TEST(mt19937_calls, two_hundred_in_flight_give_consecutive_stretches) {
  constexpr std::int64_t calls = 200;
  constexpr std::int64_t n = 37;
  sycl::queue queue = gpu_queue();
  const shared_words drawn(queue, static_cast<std::size_t>(calls * n));
  {
    mt19937 engine(queue, seed);
    gate shut(queue);
    for (std::int64_t call = 0; call < calls; ++call) {
      rng::generate(rng::bits<>(), engine, n, drawn.get() + call * n, {shut.closed});
    }
    EXPECT_EQ(drawn.values()[0], tarn_test::marker<std::uint32_t>());
    shut.open();
  }
  EXPECT_TRUE(drawn.values() == serial(0, calls * n));
}

TARN_REPORTS_CUDA(mt19937_objects)

}  // namespace
