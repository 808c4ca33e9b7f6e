// SPDX-License-Identifier: Apache-2.0
// mrg32k3a on a GPU queue: long calls of the default mode, copies, services and refusals of the
// sub-sequence modes, and the level below the public class.
#include <algorithm>
#include <cstdint>
#include <cstring>
#include <initializer_list>
#include <memory>
#include <string>
#include <tarn_rvx.h>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <kestrel/tarn/rng/device_level.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "engines/mrg32k3a_kernels.hpp"
#include "frame/checks.hpp"
#include "in_flight.hpp"
#include "message.hpp"
#include "mrg32k3a_round.hpp"
#include "queues.hpp"
#include "routine_samples.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
namespace detail = rng::detail;
using rng::mrg32k3a;
using rng::mrg32k3a_mode::custom;
using rng::mrg32k3a_mode::optimal;
using tarn_test::cpu_queue;
using tarn_test::draw;
using tarn_test::gpu_queue;
using tarn_test::message_of;
using tarn_test::mrg32k3a_round;

const rng::uniform<double> reals(-1.0, 3.0);

template <typename Distr>
struct row_of {
  using distribution = Distr;
};

TEST(mrg32k3a_default_mode, has_longer_runs_from_32_million_on) {
  EXPECT_EQ(detail::mrg32k3a_per_item(1), 64u);
  EXPECT_EQ(detail::mrg32k3a_per_item(31999999), 64u);
  EXPECT_EQ(detail::mrg32k3a_per_item(32000000), 512u);
}

// Whole groups: as many as hold the results, in a group of 1024 each 65536 of them.
TEST(mrg32k3a_default_mode, one_group_more_begins_behind_a_full_one) {
  using detail::mrg32k3a_work_items;
  EXPECT_EQ(mrg32k3a_work_items(0, 1024), 0u);
  EXPECT_EQ(mrg32k3a_work_items(1, 1024), 1024u);
  EXPECT_EQ(mrg32k3a_work_items(65536, 1024), 1024u);
  EXPECT_EQ(mrg32k3a_work_items(65537, 1024), 2048u);
  EXPECT_EQ(mrg32k3a_work_items(32000000, 1024), 62u * 1024);  // 61.03 of 524288
  EXPECT_EQ(mrg32k3a_work_items(31999999, 64), 7813u * 64);    // 7812.5 of 4096
}

TEST(mrg32k3a_default_mode, long_calls_follow_the_serial_sequence) {
  constexpr std::size_t block = 1000000;
  mrg32k3a host(cpu_queue(), 7);
  sycl::queue queue = gpu_queue();
  mrg32k3a engine(queue, 7);
  std::vector<std::uint32_t> expected(block);
  for (const std::size_t n : {31999999, 32000000}) {
    auto* words = sycl::malloc_shared<std::uint32_t>(n + tarn_test::guard_size, queue);
    std::fill(words, words + n + tarn_test::guard_size, 0u);  // no word is 0
    rng::generate(rng::bits<>(), engine, static_cast<std::int64_t>(n), words).wait();
    for (std::size_t first = 0; first < n; first += block) {
      const std::size_t size = std::min(block, n - first);
      rng::generate(rng::bits<>(), host, static_cast<std::int64_t>(size), expected.data());
      ASSERT_EQ(std::memcmp(words + first, expected.data(), size * sizeof(std::uint32_t)), 0)
          << "from " << first << " of " << n;
    }
    EXPECT_TRUE(std::all_of(words + n, words + n + tarn_test::guard_size,
                            [](std::uint32_t word) { return word == 0; }));
    sycl::free(words, queue);
  }
}

// Results of two words each, in runs of 64 results.
TEST(mrg32k3a_default_mode, pairs_follow_the_serial_sequence) {
  const rng::gaussian<double, rng::gaussian_method::box_muller> normal(1.0, 2.0);
  for (const std::int64_t n : {1, 63, 64, 65, 4096, 4097, 10000}) {
    mrg32k3a engine(gpu_queue(), 7);
    mrg32k3a_round serial({7}, 1);
    EXPECT_TRUE(tarn_test::same_reals(engine.get_queue(), draw(normal, engine, n),
                                      serial.draw(normal, static_cast<std::uint64_t>(n))))
        << n;
    EXPECT_EQ(draw(reals, engine, 5), serial.draw(reals, 5)) << "after " << n;
  }
}

TEST(mrg32k3a_default_mode, counts_past_the_range_of_a_kernel_are_refused) {
  mrg32k3a engine(gpu_queue());
  std::uint32_t value = 7;
  for (const std::int64_t n : {std::int64_t{1} << 41, std::int64_t{1} << 62, INT64_MAX}) {
    EXPECT_NE(message_of<sycl::exception>([&] { rng::generate(rng::bits<>(), engine, n, &value); }),
              "[nothing raised]");
  }
  EXPECT_EQ(value, 7u);
}

// Seeds after which both recurrences give 527612 (see the tests of the stepping): the greatest
// word, with which a float passes the upper bound by rounding.
TEST(mrg32k3a_default_mode, only_the_accurate_method_clamps) {
  using plain_mrg::cpp_int;
  const cpp_int inverse =
      powm(cpp_int(1403580), cpp_int(plain_mrg::m1 - 2), cpp_int(plain_mrg::m1));
  const auto k = static_cast<std::uint32_t>(inverse * 527612 % plain_mrg::m1);
  mrg32k3a engine(gpu_queue(), {0, k, 0, 0, 0, 1});
  mrg32k3a copy(engine);
  mrg32k3a clamped(engine);
  EXPECT_EQ(draw(rng::bits<>(), engine, 1)[0], 4294967087u);
  EXPECT_EQ(draw(rng::uniform<float>(-0.5f, 0.7f), copy, 1)[0], 0.7f + 0x1p-23f);
  using accurate = rng::uniform_method::accurate;
  EXPECT_EQ(draw(rng::uniform<float, accurate>(-0.5f, 0.7f), clamped, 1)[0], 0.7f);
}

TEST(mrg32k3a_modes, copies_go_on_alone) {
  mrg32k3a source(gpu_queue(), 7, custom(7));
  mrg32k3a_round model({7}, 7);
  EXPECT_EQ(draw(reals, source, 10), model.draw(reals, 10));
  mrg32k3a_round same = model;
  mrg32k3a copy(source);
  EXPECT_EQ(draw(reals, source, 9), model.draw(reals, 9));
  EXPECT_EQ(draw(reals, copy, 5), same.draw(reals, 5));

  mrg32k3a assigned(gpu_queue(), 3, optimal());
  assigned = source;
  mrg32k3a_round third = model;
  EXPECT_EQ(draw(reals, source, 4), model.draw(reals, 4));
  EXPECT_EQ(draw(reals, assigned, 30), third.draw(reals, 30));
  mrg32k3a& itself = assigned;
  assigned = itself;
  EXPECT_EQ(draw(reals, assigned, 5), third.draw(reals, 5));

  mrg32k3a serial(gpu_queue(), 3);
  assigned = serial;  // back to the default mode
  EXPECT_EQ(draw(rng::bits<>(), assigned, 9), draw(rng::bits<>(), serial, 9));
}

// A copy made while a kernel waits to run is one of what that kernel leaves behind.
TEST(mrg32k3a_modes, copies_wait_for_the_last_call) {
  sycl::queue queue = gpu_queue();
  mrg32k3a source(queue, 7, custom(7));
  mrg32k3a_round model({7}, 7);
  tarn_test::gate shut(queue);
  tarn_test::results<double> values(queue, 100);
  rng::generate(reals, source, 100, values.get(), {shut.closed});
  std::unique_ptr<mrg32k3a> copy;
  shut.open_during([&] { copy = std::make_unique<mrg32k3a>(source); });
  EXPECT_EQ(values.values(), model.draw(reals, 100));
  EXPECT_EQ(draw(reals, *copy, 30), model.draw(reals, 30));
}

TEST(mrg32k3a_modes, moves_take_over) {
  mrg32k3a source(gpu_queue(), 7, custom(7));
  mrg32k3a_round model({7}, 7);
  draw(reals, source, 10);
  model.draw(reals, 10);
  mrg32k3a target(std::move(source));
  EXPECT_EQ(draw(reals, target, 9), model.draw(reals, 9));
  source = mrg32k3a(gpu_queue(), 8, custom(2));
  mrg32k3a_round other({8}, 2);
  EXPECT_EQ(draw(reals, source, 5), other.draw(reals, 5));
  source = std::move(target);
  EXPECT_EQ(draw(reals, source, 9), model.draw(reals, 9));
}

/// Draws one result, or is refused and writes nothing, in both output forms.
template <typename Distr>
void expect_kernel(mrg32k3a& engine, bool there) {
  using T = typename Distr::result_type;
  constexpr std::int64_t n = 1;
  const Distr distr = tarn_test::sample<Distr>::make(n);
  const std::string expected =
      there ? "[nothing raised]"
            : "kestrel::tarn::rng::generate: invalid argument: mrg32k3a with optimal/custom modes "
              "doesn't support this distribution";
  constexpr std::size_t room = 16;
  const tarn_test::results<T> values(engine.get_queue(), room);
  sycl::buffer<T, 1> buffer{sycl::range<1>(room)};
  EXPECT_EQ(message_of<tarn::invalid_argument>(
                [&] { rng::generate(distr, engine, n, values.get()).wait(); }),
            expected);
  EXPECT_EQ(message_of<tarn::invalid_argument>([&] { rng::generate(distr, engine, n, buffer); }),
            expected);
  EXPECT_EQ(tarn_test::same_bits(*values.get(), tarn_test::marker<T>()), !there);
}

TEST(mrg32k3a_modes, have_kernels_of_uniform_and_gaussian_alone) {
  using namespace rng;
  using rng::gamma;  // <math.h> has one as well
  mrg32k3a engines[] = {mrg32k3a(gpu_queue(), 7, optimal()), mrg32k3a(gpu_queue(), 7, custom(7))};
  for (mrg32k3a& engine : engines) {
    int kernels = 0;
    int refusals = 0;
    const auto expect = [&](auto row, const std::string& family) {
      using Distr = typename decltype(row)::distribution;
      // Those are refused on whatever queue, before.
      if constexpr (!detail::is_refused<Distr, mrg32k3a>) {
        SCOPED_TRACE(family);
        const bool there = family == "uniform" || family == "gaussian";
        expect_kernel<Distr>(engine, there);
        ++(there ? kernels : refusals);
      }
    };
#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) \
  expect(row_of<TARN_UNWRAP type>{}, #family);
#include "distributions/distributions.def"
    EXPECT_EQ(kernels, 8 + 6);
    EXPECT_EQ(refusals, 89 - 2 - kernels);  // all rows but uniform_bits
  }
}

TEST(mrg32k3a_modes, refuse_list_skips_and_saving) {
  mrg32k3a engine(gpu_queue(), 7, custom(7));
  draw(reals, engine, 3);
  const auto failure = [](auto call) { return message_of<tarn::computation_error>(call); };
  EXPECT_EQ(failure([&] {
              rng::skip_ahead(engine, {1, 0});
            }),
            "kestrel::tarn::rng::skip_ahead: computation error: mrg32k3a engine with sub-sequence "
            "parallelization");
  std::vector<std::uint8_t> image(static_cast<std::size_t>(rng::get_state_size(engine)), 0xA5);
  const std::vector<std::uint8_t> untouched = image;
  const std::string unsaved =
      "kestrel::tarn::rng::save_state: computation error:  does not support mrg32k3a with "
      "sub-sequence parallelization";
  EXPECT_EQ(failure([&] { rng::save_state(engine, image.data()); }), unsaved);
  EXPECT_EQ(failure([&] { rng::save_state(engine, testing::TempDir() + "tarn_unsaved"); }),
            unsaved);
  EXPECT_EQ(image, untouched);
  mrg32k3a_round model({7}, 7);
  model.draw(reals, 3);
  EXPECT_EQ(draw(reals, engine, 20), model.draw(reals, 20));
}

TEST(mrg32k3a_modes, are_not_in_a_saved_state) {
  mrg32k3a serial(gpu_queue(), 7);
  draw(rng::bits<>(), serial, 5);
  std::vector<std::uint8_t> image(static_cast<std::size_t>(rng::get_state_size(serial)));
  rng::save_state(serial, image.data());
  mrg32k3a loaded = rng::load_state<mrg32k3a>(gpu_queue(), image.data());
  rng::skip_ahead(loaded, {2, 0});
  rng::skip_ahead(serial, 2);
  EXPECT_EQ(draw(rng::bits<>(), loaded, 9), draw(rng::bits<>(), serial, 9));
}

// 96 GiB of records, which the host of a CUDA device may have. The assigned-to engine stays as it
// was.
TEST(mrg32k3a_modes, without_memory_for_their_records_are_refused) {
  sycl::queue queue = tarn_test::host_run_gpu_queue();
  const std::uint32_t count = ~std::uint32_t{0};
  if (queue.get_device().get_info<sycl::info::device::max_mem_alloc_size>() / 24 >= count) {
    GTEST_SKIP() << "the device has the memory";
  }
  const std::string message = "kestrel::tarn::rng::mrg32k3a: cannot allocate memory on " +
                              queue.get_device().get_info<sycl::info::device::name>();
  const std::initializer_list<std::uint32_t> list = {1, 2};
  EXPECT_EQ(message_of<tarn::device_bad_alloc>([&] { mrg32k3a(queue, 7, custom(count)); }),
            message);
  EXPECT_EQ(message_of<tarn::device_bad_alloc>([&] { mrg32k3a(queue, list, custom(count)); }),
            message);
  mrg32k3a engine(queue, 7, custom(7));
  EXPECT_EQ(message_of<tarn::device_bad_alloc>([&] { engine = mrg32k3a(queue, 7, custom(count)); }),
            message);
  EXPECT_EQ(draw(reals, engine, 20), mrg32k3a_round({7}, 7).draw(reals, 20));
}

class level : public testing::Test {
 protected:
  using impl = detail::engine_base_impl<mrg32k3a>;

  std::vector<double> next(impl* engine, std::size_t n) {
    auto* values = sycl::malloc_shared<double>(n, queue);
    detail::gpu::generate<mrg32k3a, rng::uniform<double>>(queue, reals, engine,
                                                          static_cast<std::int64_t>(n), values, {})
        .wait();
    std::vector<double> drawn(values, values + n);
    sycl::free(values, queue);
    return drawn;
  }
  void expect_and_delete(impl* engine, mrg32k3a_round model) {
    EXPECT_TRUE(next(engine, 1000) == model.draw(reals, 1000));
    detail::gpu::delete_engine(queue, engine);
  }

  sycl::queue queue = gpu_queue();
};

TEST_F(level, makes_engines_of_each_mode) {
  using detail::gpu::create_engine;
  const std::uint32_t seed[] = {5, 6, 7};
  const std::uint64_t scalar = 5;
  expect_and_delete(create_engine<mrg32k3a>(queue, scalar), {{5}, 1});
  expect_and_delete(create_engine<mrg32k3a>(queue, scalar, optimal()), {{5}, 40960});
  expect_and_delete(create_engine<mrg32k3a>(queue, scalar, custom(9)), {{5}, 9});
  expect_and_delete(create_engine<mrg32k3a>(queue, 3, seed), {{5, 6, 7}, 1});
  expect_and_delete(create_engine<mrg32k3a>(queue, 3, seed, optimal()), {{5, 6, 7}, 40960});
  expect_and_delete(create_engine<mrg32k3a>(queue, 3, seed, custom(9)), {{5, 6, 7}, 9});
  rvx_stream stream = nullptr;
  ASSERT_EQ(rvxNewStream(&stream, RVX_BRNG_MRG32K3A, 5), 0);
  expect_and_delete(create_engine<mrg32k3a>(stream), {{5}, 1});
  EXPECT_EQ(rvxDeleteStream(&stream), 0);
}

TEST_F(level, copies_and_skips) {
  namespace gpu = detail::gpu;
  auto* engine = gpu::create_engine<mrg32k3a>(queue, std::uint64_t{5}, custom(9));
  mrg32k3a_round model({5}, 9);
  EXPECT_EQ(next(engine, 12), model.draw(reals, 12));
  auto* copy = gpu::create_engine<mrg32k3a>(queue, engine);
  mrg32k3a_round skipped = model;
  skipped.skip(100);
  gpu::skip_ahead(queue, copy, 100);
  expect_and_delete(copy, skipped);
  EXPECT_EQ(message_of<tarn::computation_error>([&] { gpu::skip_ahead(queue, engine, {1}); }),
            "kestrel::tarn::rng::skip_ahead: computation error: mrg32k3a engine with sub-sequence "
            "parallelization");
  expect_and_delete(engine, model);
}

TARN_REPORTS_CUDA(mrg32k3a_modes)

}  // namespace
