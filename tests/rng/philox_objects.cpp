// SPDX-License-Identifier: Apache-2.0
// philox4x32x10 against the model of its paper: seeds, far skips, and the level below the public
// class on GPU queues. What it shares with other engines stands in the suites over all of them.
#include <cstdint>
#include <initializer_list>
#include <tarn_rvx.h>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <kestrel/tarn/rng/device_level.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "models/philox_model.hpp"
#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using tarn_test::draw;
using tarn_test::philox_model;
using engine_type = rng::philox4x32x10;
using words = std::vector<std::uint32_t>;

const rng::bits<> bits;

words model_words(const philox_model& model, tarn_test::uint128 first, std::size_t count) {
  words out;
  for (std::size_t i = 0; i < count; ++i) {
    out.push_back(model.word(first + i));
  }
  return out;
}

class philox_object : public tarn_test::over_queues {};
TARN_OVER_QUEUES(philox_object);

TEST_P(philox_object, scalar_seed_is_its_low_and_high_word) {
  static_assert(std::is_same_v<decltype(engine_type::default_seed), const std::uint64_t>);
  static_assert(engine_type::default_seed == 0);
  engine_type unseeded(queue());
  EXPECT_EQ(draw(bits, unseeded, 10), model_words(philox_model(0, 0), 0, 10));
  for (const std::uint64_t seed :
       {std::uint64_t{1}, std::uint64_t{0x7FFFFFFF}, std::uint64_t{0x80000000},
        std::uint64_t{0xFFFFFFFF}, std::uint64_t{0x9ABCDEF012345678}}) {
    engine_type engine(queue(), seed);
    const philox_model model(static_cast<std::uint32_t>(seed),
                             static_cast<std::uint32_t>(seed >> 32));
    EXPECT_EQ(draw(bits, engine, 10), model_words(model, 0, 10)) << seed;
  }
}

// A list of n items gives a CPU engine n words and a GPU engine 2n; kept, as streams depend on it.
TEST_P(philox_object, list_seed_has_half_the_words_on_a_cpu) {
  engine_type engine(queue(), {0x0000000200000001, 0x0000000400000003});
  const philox_model model = queue().get_device().is_cpu()
                                 ? philox_model(1, 2)
                                 : philox_model(1, 2, tarn_test::uint128{0x0000000400000003});
  EXPECT_EQ(draw(bits, engine, 12), model_words(model, 0, 12));
}

TEST_P(philox_object, empty_list_is_a_zero_seed) {
  engine_type engine(queue(), std::initializer_list<std::uint64_t>{});
  EXPECT_EQ(draw(bits, engine, 5), model_words(philox_model(0, 0), 0, 5));
}

TEST_P(philox_object, skipping_equals_drawing) {
  std::uint64_t skips[] = {0,
                           1,
                           2,
                           3,
                           4,
                           5,
                           1000,
                           (std::uint64_t{1} << 34) + 7,
                           (std::uint64_t{1} << 63) + 5,
                           ~std::uint64_t{5}};
  for (const std::uint64_t skip : skips) {
    for (const std::int64_t before : {0, 1, 6}) {
      engine_type engine(queue(), 31);
      draw(bits, engine, before);
      rng::skip_ahead(engine, skip);
      const auto at = tarn_test::uint128{skip} + static_cast<std::uint64_t>(before);
      EXPECT_EQ(draw(bits, engine, 9), model_words(philox_model(31, 0), at, 9))
          << "skip " << skip << " after " << before;
    }
  }
}

TEST_P(philox_object, a_list_skip_is_a_number_in_64_bit_digits) {
  engine_type engine(queue(), 31);
  draw(bits, engine, 3);
  rng::skip_ahead(engine, {5, 7});
  const tarn_test::uint128 at = (tarn_test::uint128{7} << 64) + 5 + 3;
  EXPECT_EQ(draw(bits, engine, 9), model_words(philox_model(31, 0), at, 9));
}

// The level below the public class, for callers without an engine object.
TEST(gpu_level, makes_moves_and_draws) {
  namespace gpu = rng::detail::gpu;
  sycl::queue queue = tarn_test::gpu_queue();
  auto* engine = gpu::create_engine<engine_type>(queue, std::uint64_t{3});
  auto* values = sycl::malloc_shared<std::uint32_t>(8, queue);
  gpu::skip_ahead(queue, engine, std::uint64_t{2});
  gpu::generate<engine_type, rng::bits<>>(queue, bits, engine, 8, values, {}).wait();
  EXPECT_EQ(words(values, values + 8), model_words(philox_model(3, 0), 2, 8));
  auto* copy = gpu::create_engine<engine_type>(queue, engine);
  gpu::skip_ahead(queue, engine, {0, 1});
  gpu::generate<engine_type, rng::bits<>>(queue, bits, engine, 8, values, {}).wait();
  EXPECT_EQ(words(values, values + 8),
            model_words(philox_model(3, 0), (tarn_test::uint128{1} << 64) + 10, 8));
  gpu::generate<engine_type, rng::bits<>>(queue, bits, copy, 8, values, {}).wait();
  EXPECT_EQ(words(values, values + 8), model_words(philox_model(3, 0), 10, 8));
  gpu::delete_engine(queue, copy);
  gpu::delete_engine(queue, engine);
  const std::uint32_t seed[] = {1, 2, 3};
  auto* listed = gpu::create_engine<engine_type>(queue, 3, seed);
  gpu::generate<engine_type, rng::bits<>>(queue, bits, listed, 8, values, {}).wait();
  EXPECT_EQ(words(values, values + 8), model_words(philox_model(1, 2, 3), 0, 8));
  gpu::delete_engine(queue, listed);

  rvx_stream stream = nullptr;
  ASSERT_EQ(rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 9), 0);
  auto* wrapped = gpu::create_engine<engine_type>(stream);  // a copy: the stream stays its owner's
  EXPECT_EQ(rvxDeleteStream(&stream), 0);
  std::vector<std::uint32_t> buffered(8);
  {
    sycl::buffer<std::uint32_t, 1> buffer(buffered.data(), sycl::range<1>(8));
    gpu::generate<engine_type, rng::bits<>>(queue, bits, wrapped, 8, buffer, {}).wait();
  }
  EXPECT_EQ(buffered, model_words(philox_model(9, 0), 0, 8));
  gpu::delete_engine(queue, wrapped);
  sycl::free(values, queue);
}

}  // namespace
