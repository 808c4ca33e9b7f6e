// SPDX-License-Identifier: Apache-2.0
// sobol on a GPU queue as an object: the end of the sequence, direction numbers of the user, saved
// states, streams that are not for devices, and the level below the public class.
#include <cstdint>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <kestrel/tarn/rng/device_level.hpp>

#include <gtest/gtest.h>

#include "engines/sobol.hpp"
#include "every_engine.hpp"
#include "frame/engine_backend.hpp"
#include "in_flight.hpp"
#include "message.hpp"
#include "silence.hpp"
#include "sobol_pair.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
namespace detail = rng::detail;
using namespace tarn_test;
using rng::sobol;
using words = std::vector<std::uint32_t>;

const rng::bits<> bits;
const rng::gaussian<double, rng::gaussian_method::box_muller> pairs(1, 2);
const std::string past_the_end =
    "kestrel::tarn::rng::sobol: computation error: generator period is exceeded";

template <typename Call>
std::string failure(const Call& call) {
  return message_of<tarn::computation_error>(call);
}

TEST(sobol_period, counts_that_reach_2_to_the_32_pass) {
  for (const std::uint32_t dimensions : {1u, 3u}) {
    sobol_pair both(dimensions);
    both.skip(std::uint64_t{0xFFFFFFFF} * dimensions);  // index 1 and 2^32 - 1 points
    both.expect_state();
    both.expect_words(0);
    both.skip(0);
    both.expect_state();

    sobol engine(gpu_queue(), dimensions);
    rng::skip_ahead(engine, (std::uint64_t{0xFFFFFFFF} - 100) * dimensions);
    EXPECT_EQ(draw(bits, engine, 100 * dimensions).size(), 100u * dimensions);
    EXPECT_EQ(image_of(engine), image_of(both.host));
  }
}

/// Every way to ask for a word more than `left` from an engine that has so many.
void expect_refusals(sobol& engine, std::uint64_t left) {
  const image before = image_of(engine);
  results<std::uint32_t> out(engine.get_queue(), 64);
  results<double> reals(engine.get_queue(), 64);
  sycl::buffer<std::uint32_t, 1> buffer{sycl::range<1>(64)};
  const auto n = static_cast<std::int64_t>(left);
  // A command behind the closed gate could not have run: the refusal comes from the call itself.
  gate shut(engine.get_queue());
  const std::vector<sycl::event> closed = {shut.closed};
  EXPECT_EQ(failure([&] { rng::generate(bits, engine, n + 1, out.get(), closed); }), past_the_end);
  EXPECT_EQ(failure([&] { rng::generate(bits, engine, n + 1, buffer); }), past_the_end);
  EXPECT_EQ(failure([&] { rng::generate(bits, engine, INT64_MAX, out.get(), closed); }),
            past_the_end);
  EXPECT_EQ(failure([&] { rng::generate(pairs, engine, n / 2 + 1, reals.get(), closed); }),
            past_the_end);
  EXPECT_EQ(failure([&] { rng::generate(pairs, engine, INT64_MAX, reals.get(), closed); }),
            past_the_end);
  EXPECT_EQ(failure([&] { rng::skip_ahead(engine, left + 1); }), past_the_end);
  EXPECT_EQ(failure([&] { rng::skip_ahead(engine, ~std::uint64_t{0}); }), past_the_end);
  shut.open();
  engine.get_queue().wait();
  EXPECT_TRUE(out.untouched());
  EXPECT_TRUE(reals.untouched());
  EXPECT_EQ(image_of(engine), before);
}

TEST(sobol_period, what_would_go_past_the_end_is_refused_before_anything_is_submitted) {
  for (const std::uint32_t dimensions : {1u, 3u, 49u}) {
    for (const std::uint64_t left : {0u, 1u, 2u, 7u, 49u}) {
      SCOPED_TRACE(std::to_string(left) + " in " + std::to_string(dimensions));
      sobol_pair both(dimensions);
      both.skip_to_the_end_but(left);
      expect_refusals(both.engine, left);
      both.expect_words(static_cast<std::int64_t>(left));
      both.expect_state();
    }
  }
}

// The record at the end has the index 0, which is not point 0.
TEST(sobol_period, an_engine_at_the_end_stays_there_when_it_is_saved_and_copied) {
  sobol_pair both(3);
  both.skip_to_the_end_but(0);
  const image saved = image_of(both.engine);
  for (const image& from : {saved, image_of(both.host)}) {
    auto loaded = rng::load_state<sobol>(gpu_queue(), from.data());
    expect_refusals(loaded, 0);
    sobol copy = loaded;
    expect_refusals(copy, 0);
  }
}

/// Directions of the default dimensions `first` on, as a user would give them.
words directions_from(std::uint32_t first, std::uint32_t dimensions) {
  const plain_stream stream(RVX_BRNG_SOBOL, std::uint64_t{first + dimensions});
  const detail::sobol_record record(stream);
  words table;
  for (std::uint32_t d = first; d < first + dimensions; ++d) {
    table.insert(table.end(), record.directions(d), record.directions(d) + 32);
  }
  return table;
}

TEST(sobol_direction_numbers, of_the_user_come_back_with_a_header) {
  for (const std::uint32_t dimensions : {1u, 2u, 39u, 48u, 49u, 1111u}) {
    const words table = directions_from(1, dimensions);
    words given = table;
    words same = table;
    sobol engine(gpu_queue(), given);
    sobol host(cpu_queue(), same);
    words headed = {dimensions, 1, 4};
    headed.insert(headed.end(), table.begin(), table.end());
    EXPECT_EQ(given, headed);
    for (const std::int64_t n : {5, 4000}) {
      ASSERT_EQ(draw(bits, engine, n), draw(bits, host, n)) << dimensions;
    }
    EXPECT_EQ(image_of(engine), image_of(host));
  }
}

TEST(sobol_direction_numbers, that_make_no_stream_stay_as_they_were) {
  const silence reports;
  words torn(31, 1);
  EXPECT_EQ(failure([&] { sobol(gpu_queue(), torn); }),
            "kestrel::tarn::rng::engine initialization: computation error: initialization failure");
  EXPECT_EQ(torn, words(31, 1));
}

TEST(sobol_states, go_from_device_to_device_at_any_place) {
  std::mt19937 random(7);
  for (const std::uint32_t dimensions : {1u, 3u, 48u, 49u}) {
    sobol_pair both(dimensions);
    for (int round = 0; round < 30; ++round) {
      both.expect_words(static_cast<std::int64_t>(random() % 200));
      const image from_device = image_of(both.engine);
      ASSERT_EQ(from_device, image_of(both.host));
      auto on_host = rng::load_state<sobol>(cpu_queue(), from_device.data());
      const image from_host = image_of(both.host);
      auto on_device = rng::load_state<sobol>(gpu_queue(), from_host.data());
      const auto n = static_cast<std::int64_t>(random() % 200);
      const words expected = draw(bits, both.host, n);
      ASSERT_EQ(draw(bits, on_host, n), expected);
      ASSERT_EQ(draw(bits, on_device, n), expected);
      ASSERT_EQ(draw(bits, both.engine, n), expected);  // saving has moved nothing
      both.engine = std::move(on_device);
    }
  }
}

TEST(sobol_states, of_user_directions_are_loaded_with_them) {
  words table = directions_from(7, 5);
  sobol engine(gpu_queue(), table);
  draw(bits, engine, 12);
  const image saved = image_of(engine);
  auto loaded = rng::load_state<sobol>(gpu_queue(), saved.data());
  EXPECT_EQ(draw(bits, loaded, 99), draw(bits, engine, 99));
}

// Streams of our own statistics library have the marker; whoever takes it away keeps an engine off
// devices.
TEST(sobol_marker, without_it_nothing_is_drawn_on_a_device) {
  sobol_pair both(3);
  both.expect_words(4);
  const image before = image_of(both.engine);
  EXPECT_EQ(before[24] & before[25] & before[26] & before[27], 0xFF);
  auto& marker_word =
      detail::sobol_record(detail::engine_access::impl(both.engine)->stream.get()).words[2];
  marker_word = 1;
  results<std::uint32_t> out(gpu_queue(), 64);
  results<double> normals(gpu_queue(), 64);
  gate shut(gpu_queue());
  sycl::event event = rng::generate(bits, both.engine, 64, out.get(), {shut.closed});
  event.wait();  // an event without a command, though the gate is shut
  rng::generate(pairs, both.engine, 64, normals.get(), {shut.closed}).wait();
  EXPECT_EQ(event, sycl::event());
  shut.open();
  // Nothing is made of candidates and scratch that nobody has written.
  rng::generate(rng::gamma<double>(2.5), both.engine, 64, normals.get()).wait();
  rng::generate(rng::chi_square<double>(1), both.engine, 64, normals.get()).wait();
  EXPECT_TRUE(out.untouched());
  EXPECT_TRUE(normals.untouched());
  marker_word = 0xFFFFFFFF;
  EXPECT_EQ(image_of(both.engine), before);
  both.expect_words(5);
}

TEST(sobol_uniform_bits, are_refused) {
  sobol engine(gpu_queue(), 3);
  results<std::uint64_t> out(gpu_queue(), 4);
  EXPECT_EQ(message_of<tarn::unimplemented>(
                [&] { rng::generate(rng::uniform_bits<std::uint64_t>(), engine, 4, out.get()); }),
            "kestrel::tarn::rng::generate: unimplemented functionality: uniform_bits distribution "
            "and sobol engine combination");
  EXPECT_TRUE(out.untouched());
}

class sobol_level : public testing::Test {
 protected:
  using impl = detail::engine_base_impl<sobol>;

  void expect_words_of(impl* engine, sobol& host) {
    results<std::uint32_t> out(queue, 500);
    detail::gpu::generate<sobol, rng::bits<>>(queue, bits, engine, 500, out.get(), {}).wait();
    EXPECT_EQ(out.values(), draw(bits, host, 500));
  }

  sycl::queue queue = gpu_queue();
};

TEST_F(sobol_level, makes_copies_and_skips_engines) {
  namespace gpu = detail::gpu;
  sobol host(cpu_queue(), 7);
  impl* engine = gpu::create_engine<sobol>(queue, std::uint64_t{7});
  expect_words_of(engine, host);
  impl* copy = gpu::create_engine<sobol>(queue, engine);
  gpu::skip_ahead(queue, engine, 100);
  sobol host_copy = host;
  rng::skip_ahead(host, 100);
  expect_words_of(engine, host);
  expect_words_of(copy, host_copy);
  EXPECT_EQ(failure([&] { gpu::skip_ahead(queue, copy, ~std::uint64_t{0}); }), past_the_end);
  gpu::delete_engine(queue, engine);
  gpu::delete_engine(queue, copy);
}

// From where the stream stands, which stays there.
TEST_F(sobol_level, makes_engines_of_streams) {
  for (const std::uint32_t dimensions : {5u, 49u}) {
    const plain_stream stream(RVX_BRNG_SOBOL, std::uint64_t{dimensions});
    ASSERT_EQ(rvxSkipAheadStream(stream, 12345), 0);
    sobol host(cpu_queue(), dimensions);
    rng::skip_ahead(host, 12345);
    const image before = stream.bytes();
    impl* engine = detail::gpu::create_engine<sobol>(queue, static_cast<void*>(stream));
    expect_words_of(engine, host);
    EXPECT_EQ(stream.bytes(), before);
    detail::gpu::delete_engine(queue, engine);
  }
}

TARN_REPORTS_CUDA(sobol_objects)

}  // namespace
