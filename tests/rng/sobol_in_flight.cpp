// SPDX-License-Identifier: Apache-2.0
// sobol on a GPU queue with work in flight, and without memory for its image or for the words
// between the two kernels of a call on pairs.
#include <cstdint>
#include <cstdlib>
#include <future>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "every_engine.hpp"
#include "in_flight.hpp"
#include "message.hpp"
#include "sobol_pair.hpp"

namespace {

// Blocks of this many bytes cannot be had.
std::size_t unavailable = 0;
int refused = 0;

}  // namespace

// In place of the C library's, from which the runtime takes the memory of a virtual device.
extern "C" [[gnu::visibility("default")]] int posix_memalign(void** block, std::size_t alignment,
                                                             std::size_t bytes) noexcept {
  if (bytes == unavailable && bytes != 0) {
    ++refused;
    return 12;  // ENOMEM
  }
  *block = std::aligned_alloc(alignment, (bytes + alignment - 1) / alignment * alignment);
  return *block != nullptr ? 0 : 12;
}

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
using namespace tarn_test;
using rng::sobol;
using words = std::vector<std::uint32_t>;

const rng::bits<> bits;
const rng::gaussian<double, rng::gaussian_method::box_muller> pairs(1, 2);

/// Thirty calls, each behind the gate, and two skips; what the host draws of them.
struct calls_in_flight {
  static constexpr std::size_t n = 37;
  static constexpr std::size_t calls = 30;

  calls_in_flight(sobol& engine, const gate& shut)
      : out(engine.get_queue(), n * calls), normals(engine.get_queue(), n) {
    for (std::size_t call = 0; call < calls; ++call) {
      rng::generate(bits, engine, n, out.get() + call * n, {shut.closed});
      if (call % 15 == 7) {
        rng::skip_ahead(engine, 11);
      }
    }
    last = rng::generate(pairs, engine, n, normals.get(), {shut.closed});
  }

  /// The same calls of the host, which moves with them.
  void expect_same(sobol& host) {
    words expected;
    for (std::size_t call = 0; call < calls; ++call) {
      const words some = draw(bits, host, n);
      expected.insert(expected.end(), some.begin(), some.end());
      if (call % 15 == 7) {
        rng::skip_ahead(host, 11);
      }
    }
    EXPECT_EQ(out.values(), expected);
    const auto expected_normals = draw(pairs, host, n);
    for (std::size_t i = 0; i < n; ++i) {
      EXPECT_NEAR(normals.values()[i], expected_normals[i], 1e-13);  // a few units of 10
    }
  }

  results<std::uint32_t> out;
  results<double> normals;
  sycl::event last;
};

// Nothing of a call waits, with one kernel or with two: else these calls would wait for ever.
TEST(sobol_in_flight, calls_and_skips_do_not_wait) {
  sobol_pair both(3);
  gate shut(gpu_queue());
  calls_in_flight flight(both.engine, shut);
  EXPECT_TRUE(flight.out.untouched());
  EXPECT_TRUE(flight.normals.untouched());
  shut.open();
  flight.last.wait();
  flight.expect_same(both.host);
  both.expect_state();
}

TEST(sobol_in_flight, moves_take_the_work_along) {
  sobol_pair both(5);
  gate shut(gpu_queue());
  calls_in_flight flight(both.engine, shut);
  sobol moved = std::move(both.engine);
  both.engine = sobol(gpu_queue(), 7);
  sobol again(gpu_queue(), 2);
  again = std::move(moved);
  calls_in_flight more(again, shut);
  shut.open();
  more.last.wait();
  flight.expect_same(both.host);
  more.expect_same(both.host);
  EXPECT_EQ(image_of(again), image_of(both.host));
}

TEST(sobol_in_flight, copies_are_of_the_place_behind_the_calls) {
  sobol_pair both(49);
  gate shut(gpu_queue());
  calls_in_flight flight(both.engine, shut);
  auto copied = std::async(std::launch::async, [&] { return sobol(both.engine); });
  shut.open();
  sobol copy = copied.get();
  flight.last.wait();
  flight.expect_same(both.host);
  EXPECT_EQ(image_of(copy), image_of(both.host));
  EXPECT_EQ(draw(bits, copy, 500), draw(bits, both.host, 500));
  EXPECT_NE(image_of(copy), image_of(both.engine));
}

TEST(sobol_in_flight, destruction_waits_for_the_kernels) {
  sobol host(cpu_queue(), 3);
  auto engine = std::make_unique<sobol>(gpu_queue(), 3);
  gate shut(gpu_queue());
  calls_in_flight flight(*engine, shut);
  auto destroyed = std::async(std::launch::async, [&] { engine.reset(); });
  EXPECT_TRUE(flight.out.untouched());
  shut.open();
  destroyed.get();
  flight.last.wait();
  flight.expect_same(host);
}

/// What a call says while blocks of `bytes` cannot be had.
template <typename Call>
std::string refusal(std::size_t bytes, const Call& call) {
  unavailable = bytes;
  refused = 0;
  const std::string message = message_of<tarn::device_bad_alloc>(call);
  unavailable = 0;
  EXPECT_EQ(refused, 1);
  return message;
}

std::string no_memory() {
  return "kestrel::tarn::rng::sobol: cannot allocate memory on " +
         host_run_gpu_queue().get_device().get_info<sycl::info::device::name>();
}

TEST(sobol_without_memory, for_its_image_cannot_be_made_copied_or_loaded) {
  constexpr std::uint32_t dimensions = 1009;
  const sycl::queue queue = host_run_gpu_queue();
  sobol source(queue, dimensions);
  draw(bits, source, 2000);
  const image saved = image_of(source);
  words table(32 * dimensions, 1);
  // The direction words, then the current point.
  for (const std::size_t bytes : {std::size_t{128} * dimensions, std::size_t{4} * dimensions}) {
    EXPECT_EQ(refusal(bytes, [&] { sobol(queue, dimensions); }), no_memory());
    EXPECT_EQ(refusal(bytes, [&] { sobol(queue, table); }), no_memory());
    EXPECT_EQ(refusal(bytes, [&] { sobol copy(source); }), no_memory());
    sobol other(queue, 3);
    EXPECT_EQ(refusal(bytes, [&] { other = source; }), no_memory());
    sobol same(queue, 3);
    EXPECT_EQ(draw(bits, other, 5), draw(bits, same, 5));
    EXPECT_EQ(refusal(bytes, [&] { rng::load_state<sobol>(queue, saved.data()); }), no_memory());
  }
  EXPECT_EQ(table, words(32 * dimensions, 1));
  EXPECT_EQ(image_of(source), saved);
}

TEST(sobol_without_memory, for_the_words_of_pairs_stays_where_it_is) {
  sobol engine(host_run_gpu_queue(), 3);
  draw(bits, engine, 4);
  const image before = image_of(engine);
  constexpr std::size_t n = 1013;
  results<double> out(host_run_gpu_queue(), n);
  EXPECT_EQ(refusal(8 * n, [&] { rng::generate(pairs, engine, n, out.get()); }), no_memory());
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(image_of(engine), before);
}

}  // namespace
