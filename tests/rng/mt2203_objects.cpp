// SPDX-License-Identifier: Apache-2.0
// mt2203 on GPU queues as an object: single members against the serial sequence of the host, saved
// states and their refusal, copies, moves and ends with kernels in flight, the level below.
#include <algorithm>
#include <cstdint>
#include <cstring>
#include <initializer_list>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <kestrel/tarn/rng/device_level.hpp>

#include <gtest/gtest.h>

#include "device_engines.hpp"
#include "drawing.hpp"
#include "every_engine.hpp"
#include "in_flight.hpp"
#include "message.hpp"
#include "mt2203_model.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
namespace detail = rng::detail;
using rng::mt2203;
using tarn_test::cpu_queue;
using tarn_test::draw;
using tarn_test::gate;
using tarn_test::gpu_queue;
using tarn_test::gpu_queues;
using tarn_test::image;
using tarn_test::image_of;
using tarn_test::message_of;
using tarn_test::mt2203_family;
using words = std::vector<std::uint32_t>;
using shared_words = tarn_test::results<std::uint32_t>;

constexpr std::uint32_t seed = 77;
constexpr std::uint32_t member = 5000;

words next(mt2203& engine, std::int64_t n) {
  return draw(rng::bits<>(), engine, n);
}

/// Words of the serial sequence of the member.
words serial(std::int64_t first, std::int64_t n) {
  static const words run = [] {
    mt2203 host(cpu_queue(), seed, member);
    return next(host, 20000);
  }();
  return words(run.begin() + first, run.begin() + first + n);
}
mt2203 on_gpu() {
  return mt2203(gpu_queue(), seed, member);
}

TEST(mt2203_members, have_the_words_of_the_host) {
  for (std::int64_t n = 0; n <= 300; ++n) {
    const auto queues = gpu_queues();
    mt2203 engine(queues[static_cast<std::size_t>(n) % queues.size()], seed, member);
    ASSERT_EQ(next(engine, n), serial(0, n)) << n;
    ASSERT_EQ(next(engine, 7), serial(n, 7)) << "after " << n;
    ASSERT_EQ(next(engine, 500), serial(n + 7, 500)) << "after " << n;
  }
}

TEST(mt2203_members, have_the_words_of_the_host_in_any_cut) {
  std::mt19937 random(5);
  for (int trial = 0; trial < 20; ++trial) {
    mt2203 engine = on_gpu();
    std::int64_t place = 0;
    for (int call = 0; call < 20; ++call) {
      const auto n = static_cast<std::int64_t>(random() % 600);
      ASSERT_EQ(next(engine, n), serial(place, n)) << n << " from " << place;
      place += n;
    }
  }
}

TEST(mt2203_members, have_the_reals_of_the_host) {
  const auto expect_same_bits = [](const auto& distr) {
    for (const std::int64_t n : {1, 32, 33, 1023}) {
      mt2203 host(cpu_queue(), seed, member);
      mt2203 engine = on_gpu();
      mt2203 same = on_gpu();
      const auto expected = draw(distr, host, n);
      ASSERT_EQ(draw(distr, engine, n), expected) << n;
      ASSERT_EQ(tarn_test::draw_into_buffer(distr, same, n), expected) << "buffer, " << n;
    }
  };
  using accurate = rng::uniform_method::accurate;
  expect_same_bits(rng::uniform<float>(-0.1f, 0.7f));
  expect_same_bits(rng::uniform<float, accurate>(1.0f, 1.0000001f));
  expect_same_bits(rng::uniform<double>(-0.1, 0.7));
  expect_same_bits(rng::uniform<std::int32_t>(-1000000000, 2000000000));
  expect_same_bits(rng::uniform<std::uint32_t, accurate>(0, 4000000000u));
  expect_same_bits(rng::uniform_bits<std::uint32_t>());
  expect_same_bits(rng::uniform_bits<std::uint64_t>());
  expect_same_bits(rng::gaussian<double, rng::gaussian_method::icdf>(1.0, 2.0));
}

TEST(mt2203_members, of_another_index_are_other_sequences) {
  mt2203 first(gpu_queue(), seed, 0);
  mt2203 last(gpu_queue(), seed, 6023);
  mt2203 host_last(cpu_queue(), seed, 6023);
  const words run = next(last, 500);
  EXPECT_EQ(run, next(host_last, 500));
  const words other = next(first, 500);
  int equal = 0;
  for (std::size_t i = 0; i < run.size(); ++i) {
    equal += run[i] == other[i] ? 1 : 0;
  }
  EXPECT_LE(equal, 1);  // of 500 pairs of words of 32 bits
}

TEST(mt2203_members, from_a_list_seed) {
  mt2203 engine(gpu_queue(), {5, 6, 7}, 9);
  mt2203 host(cpu_queue(), {5, 6, 7}, 9);
  EXPECT_EQ(next(engine, 500), next(host, 500));
}

TEST(mt2203_members, past_the_end_are_refused) {
  const std::string message =
      "kestrel::tarn::rng::mt2203: invalid argument: engine_idx is out of range [0, 6024)";
  EXPECT_EQ(message_of<tarn::invalid_argument>([] { mt2203(gpu_queue(), 1, 6024); }), message);
  EXPECT_EQ(message_of<tarn::invalid_argument>([] {
              mt2203(gpu_queue(), {1, 2}, ~std::uint32_t{0});
            }),
            message);
}

std::uint32_t position_of(const image& saved) {
  std::uint32_t position = 0;
  std::memcpy(&position, saved.data() + 292, sizeof position);
  return position;
}

// Every position of the block, the whole one included.
TEST(mt2203_states, saved_on_a_cpu_go_on_on_a_gpu_and_back) {
  const rng::uniform_bits<std::uint64_t> bits;
  for (std::int64_t place = 0; place < 140; ++place) {
    SCOPED_TRACE(place);
    mt2203 host(cpu_queue(), seed, member);
    next(host, place);
    const image saved = image_of(host);
    auto engine = rng::load_state<mt2203>(gpu_queue(), saved.data());
    const std::int64_t n = place * 7 % 101;
    ASSERT_EQ(next(engine, n), serial(place, n));
    const image again = image_of(engine);
    ASSERT_EQ(position_of(again), 69u);
    auto back = rng::load_state<mt2203>(cpu_queue(), again.data());
    ASSERT_EQ(next(back, 300), serial(place + n, 300));
    auto pairs = rng::load_state<mt2203>(gpu_queue(), saved.data());
    ASSERT_EQ(draw(bits, pairs, 100), draw(bits, host, 100));
  }
}

TEST(mt2203_states, saved_on_a_gpu_are_whole_blocks) {
  std::mt19937 random(8);
  for (int trial = 0; trial < 60; ++trial) {
    mt2203 engine = on_gpu();
    std::int64_t place = 0;
    for (int call = trial % 4; call > 0; --call) {
      const auto n = static_cast<std::int64_t>(random() % 700);
      next(engine, n);
      place += n;
    }
    SCOPED_TRACE(place);
    const image saved = image_of(engine);
    ASSERT_EQ(position_of(saved), 69u);
    for (const sycl::queue& queue : {cpu_queue(), gpu_queue()}) {
      auto loaded = rng::load_state<mt2203>(queue, saved.data());
      ASSERT_EQ(next(loaded, 300), serial(place, 300));
    }
    ASSERT_EQ(next(engine, 300), serial(place, 300));  // saving moves nothing
  }
}

TEST(mt2203_states, of_several_generators_are_refused) {
  int refused = 0;
  for (const sycl::queue& queue : gpu_queues()) {
    mt2203 engine(queue, seed);
    next(engine, 40);
    mt2203 copy = engine;
    const bool several = queue.get_device().get_info<sycl::info::device::max_compute_units>() > 1;
    refused += several ? 1 : 0;
    image saved(static_cast<std::size_t>(rng::get_state_size(engine)), 0xA5);
    const image untouched = saved;
    EXPECT_EQ(message_of<tarn::computation_error>([&] { rng::save_state(engine, saved.data()); }),
              several ? "kestrel::tarn::rng::save_state: computation error:  does not support "
                        "multi-state mt2203"
                      : "[nothing raised]");
    EXPECT_EQ(saved == untouched, several);
    EXPECT_EQ(next(engine, 500), next(copy, 500));
  }
  EXPECT_EQ(refused, 2 + static_cast<int>(tarn_test::cuda_queues().size()));
  mt2203 host(cpu_queue(), seed);
  EXPECT_EQ(message_of<tarn::computation_error>([&] { image_of(host); }), "[nothing raised]");
}

// A view reads the serial sequence, which a family does not have.
TEST(mt2203_states, of_several_generators_have_no_view) {
  mt2203 engine(gpu_queues().front(), seed);
  next(engine, 40);
  mt2203 copy = engine;
  EXPECT_NE(message_of<tarn::computation_error>([&] {
              rng::bit_generator view(engine);
              view();
            }).find("does not support multi-state mt2203"),
            std::string::npos);
  EXPECT_EQ(next(engine, 500), next(copy, 500));
}

TEST(mt2203_states, are_saved_behind_the_calls_in_flight) {
  mt2203 engine = on_gpu();
  sycl::queue& queue = engine.get_queue();
  gate shut(queue);
  const shared_words drawn(queue, 300);
  rng::generate(rng::bits<>(), engine, 300, drawn.get(), {shut.closed});
  image saved;
  shut.open_during([&] { saved = image_of(engine); });
  EXPECT_EQ(drawn.values(), serial(0, 300));
  auto loaded = rng::load_state<mt2203>(cpu_queue(), saved.data());
  EXPECT_EQ(next(loaded, 300), serial(300, 300));
}

TEST(mt2203_copies, go_on_alone) {
  for (const sycl::queue& queue : gpu_queues()) {
    const auto units = queue.get_device().get_info<sycl::info::device::max_compute_units>();
    mt2203 source(queue, seed);
    mt2203_family model(units, std::uint64_t{seed});
    EXPECT_EQ(next(source, 500), model.draw(500));
    mt2203_family same = model, third = model;
    mt2203 copy(source);
    mt2203 assigned(gpu_queue(), 3, 7);
    assigned = source;
    EXPECT_EQ(next(source, 800), model.draw(800));
    EXPECT_EQ(next(copy, 333), same.draw(333));
    EXPECT_EQ(next(assigned, 30), third.draw(30));
    EXPECT_EQ(next(source, 9), model.draw(9));
  }
}

TEST(mt2203_copies, wait_for_the_calls_of_the_source) {
  mt2203 source = on_gpu();
  sycl::queue& queue = source.get_queue();
  gate shut(queue);
  const shared_words drawn(queue, 300);
  rng::generate(rng::bits<>(), source, 300, drawn.get(), {shut.closed});
  mt2203 copy(gpu_queue(), 3);
  shut.open_during([&] { copy = source; });
  EXPECT_EQ(drawn.values(), serial(0, 300));
  EXPECT_EQ(next(copy, 300), serial(300, 300));
  EXPECT_EQ(next(source, 300), serial(300, 300));
}

TEST(mt2203_copies, of_an_engine_made_on_a_cpu_are_at_its_place) {
  mt2203 host(cpu_queue(), seed, member);
  next(host, 101);
  host.get_queue() = gpu_queue();
  mt2203 copy(host);
  EXPECT_TRUE(copy.get_queue().get_device().is_gpu());
  EXPECT_EQ(next(copy, 300), serial(101, 300));
}

TEST(mt2203_ends, wait_for_the_calls_in_flight) {
  sycl::queue queue = gpu_queue();
  gate shut(queue);
  const shared_words drawn(queue, 600), other(queue, 300);
  shut.open_during([&] {
    mt2203 assigned(queue, seed, member);
    rng::generate(rng::bits<>(), assigned, 300, other.get(), {shut.closed});
    {
      mt2203 engine(queue, seed, member);
      rng::generate(rng::bits<>(), engine, 300, drawn.get(), {shut.closed});
      mt2203 moved(std::move(engine));
      rng::generate(rng::bits<>(), moved, 300, drawn.get() + 300);
    }
    assigned = mt2203(queue, 3);
  });
  EXPECT_EQ(drawn.values(), serial(0, 600));
  EXPECT_EQ(other.values(), serial(0, 300));
}

TEST(mt2203_calls, two_hundred_in_flight_give_consecutive_stretches) {
  constexpr std::int64_t calls = 200;
  constexpr std::int64_t n = 37;
  sycl::queue queue = gpu_queue();
  const shared_words drawn(queue, static_cast<std::size_t>(calls * n));
  {
    mt2203 engine(queue, seed, member);
    gate shut(queue);
    for (std::int64_t call = 0; call < calls; ++call) {
      rng::generate(rng::bits<>(), engine, n, drawn.get() + call * n, {shut.closed});
    }
    EXPECT_EQ(drawn.values()[0], tarn_test::marker<std::uint32_t>());
    shut.open();
  }
  EXPECT_TRUE(drawn.values() == serial(0, calls * n));
}

/// Draws `n` words at the GPU level, deletes the engine.
words words_of(sycl::queue& queue, detail::engine_base_impl<mt2203>* engine, std::size_t n) {
  const shared_words drawn(queue, n);
  detail::gpu::generate<mt2203, rng::bits<>>(queue, rng::bits<>(), engine,
                                             static_cast<std::int64_t>(n), drawn.get(), {})
      .wait();
  detail::gpu::delete_engine(queue, engine);
  return drawn.values();
}

TEST(mt2203_level, makes_engines_of_each_kind) {
  using detail::gpu::create_engine;
  sycl::queue queue = gpu_queue();
  const auto units = queue.get_device().get_info<sycl::info::device::max_compute_units>();
  const std::uint32_t list[] = {5, 6, 7};
  mt2203_family scalar_model(units, std::uint64_t{seed});
  mt2203_family list_model(units, words{5, 6, 7});
  mt2203 host(cpu_queue(), {5, 6, 7}, 9);
  EXPECT_EQ(words_of(queue, create_engine<mt2203>(queue, std::uint64_t{seed}), 500),
            scalar_model.draw(500));
  EXPECT_EQ(words_of(queue, create_engine<mt2203>(queue, 3, list), 500), list_model.draw(500));
  EXPECT_EQ(words_of(queue, create_engine<mt2203>(queue, std::uint64_t{seed}, member), 500),
            serial(0, 500));
  EXPECT_EQ(words_of(queue, create_engine<mt2203>(queue, 3, list, 9), 500), next(host, 500));
}

TEST(mt2203_level, goes_on_from_a_stream) {
  using detail::gpu::create_engine;
  sycl::queue queue = gpu_queue();
  const tarn_test::plain_stream stream(0x900000 + member, std::uint64_t{seed});
  std::int64_t place = 0;
  for (const std::int64_t n : {0, 1, 33, 34, 1, 0, 68, 70}) {
    words passed(static_cast<std::size_t>(n) + 1);
    ASSERT_EQ(rvxiRngUniformBits32(RVX_RNG_METHOD_STANDARD, stream, n, passed.data()), 0);
    place += n;
    SCOPED_TRACE(place);
    auto* engine = create_engine<mt2203>(queue, static_cast<rvx_stream>(stream));
    auto* copy = create_engine<mt2203>(queue, engine);
    ASSERT_EQ(words_of(queue, engine, 300), serial(place, 300));
    ASSERT_EQ(words_of(queue, copy, 300), serial(place, 300));
  }
}

TARN_REPORTS_CUDA(mt2203_objects)

}  // namespace
