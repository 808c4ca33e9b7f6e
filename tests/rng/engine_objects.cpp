// SPDX-License-Identifier: Apache-2.0
// philox4x32x10 as an object: seeds, copies, moves, skips, saved states.
#include <cstdint>
#include <cstdio>
#include <fstream>
#include <initializer_list>
#include <string>
#include <tarn_rvx.h>
#include <type_traits>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <kestrel/tarn/rng/device_level.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "message.hpp"
#include "models/philox_model.hpp"
#include "queues.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
using tarn_test::draw;
using tarn_test::message_of;
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

TEST_P(philox_object, a_copy_goes_on_alone) {
  engine_type source(queue(), 4);
  draw(bits, source, 7);
  engine_type copy(source);
  EXPECT_EQ(draw(bits, copy, 9), model_words(philox_model(4, 0), 7, 9));
  EXPECT_EQ(draw(bits, source, 9), model_words(philox_model(4, 0), 7, 9));
  engine_type assigned(queue(), 99);
  assigned = source;
  draw(bits, source, 3);
  EXPECT_EQ(draw(bits, assigned, 4), model_words(philox_model(4, 0), 16, 4));
}

TEST_P(philox_object, self_assignment_changes_nothing) {
  engine_type engine(queue(), 4);
  draw(bits, engine, 3);
  engine_type& same = engine;
  engine = same;
  EXPECT_EQ(draw(bits, engine, 4), model_words(philox_model(4, 0), 3, 4));
}

TEST_P(philox_object, a_move_takes_over_and_leaves_the_source_assignable) {
  engine_type source(queue(), 6);
  draw(bits, source, 2);
  engine_type target(std::move(source));
  EXPECT_EQ(draw(bits, target, 4), model_words(philox_model(6, 0), 2, 4));
  source = engine_type(queue(), 8);
  EXPECT_EQ(draw(bits, source, 4), model_words(philox_model(8, 0), 0, 4));
  target = std::move(source);
  EXPECT_EQ(draw(bits, target, 4), model_words(philox_model(8, 0), 4, 4));
}

TEST(philox_object, an_assignment_may_cross_devices) {
  engine_type on_cpu(tarn_test::cpu_queue(), 6);
  engine_type on_gpu(tarn_test::gpu_queue(), 7);
  draw(bits, on_gpu, 5);
  on_cpu = on_gpu;
  EXPECT_TRUE(on_cpu.get_queue().get_device().is_gpu());
  EXPECT_EQ(draw(bits, on_cpu, 6), model_words(philox_model(7, 0), 5, 6));
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

template <typename Engine, typename = void>
inline constexpr bool skips = false;
template <typename Engine>
inline constexpr bool skips<
    Engine, std::void_t<decltype(rng::skip_ahead(std::declval<Engine&>(), std::uint64_t{}))>> =
    true;
template <typename Engine, typename = void>
inline constexpr bool leaps = false;
template <typename Engine>
inline constexpr bool
    leaps<Engine, std::void_t<decltype(rng::leapfrog(std::declval<Engine&>(), std::uint64_t{},
                                                     std::uint64_t{}))>> = true;

TEST(engine_type_properties, are_those_of_a_value) {
  static_assert(std::is_nothrow_move_constructible_v<engine_type>);
  static_assert(std::is_nothrow_move_assignable_v<engine_type>);
  static_assert(std::is_copy_constructible_v<engine_type>);
  static_assert(!std::is_polymorphic_v<engine_type>);
}

TEST(services, exist_as_the_rows_say) {
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits, built)                                                     \
  EXPECT_EQ(skips<rng::name>, skip == 1) << #name;                                           \
  EXPECT_EQ(leaps<rng::name>, leapfrog == 1) << #name;
#include "engines/engines.def"
}

TEST(saved_states, go_on_on_the_other_kind_of_device) {
  const sycl::queue queues[] = {tarn_test::cpu_queue(), tarn_test::gpu_queue()};
  for (int from = 0; from < 2; ++from) {
    engine_type engine(queues[from], 12);
    draw(bits, engine, 5);
    std::vector<std::uint8_t> image(static_cast<std::size_t>(rng::get_state_size(engine)));
    rng::save_state(engine, image.data());
    auto loaded = rng::load_state<engine_type>(queues[1 - from], image.data());
    EXPECT_EQ(loaded.get_queue(), queues[1 - from]);
    EXPECT_EQ(draw(bits, loaded, 9), model_words(philox_model(12, 0), 5, 9));
    EXPECT_EQ(draw(bits, engine, 9), model_words(philox_model(12, 0), 5, 9));
  }
}

TEST(saved_states, travel_through_a_file) {
  const std::string name = testing::TempDir() + "tarn_philox_state";
  engine_type engine(tarn_test::cpu_queue(), 12);
  draw(bits, engine, 6);
  rng::save_state(engine, name);
  auto loaded = rng::load_state<engine_type>(tarn_test::gpu_queue(), name);
  std::remove(name.c_str());
  EXPECT_EQ(draw(bits, loaded, 9), model_words(philox_model(12, 0), 6, 9));
}

TEST(saved_states, that_cannot_be_used_are_refused) {
  const sycl::queue queue = tarn_test::cpu_queue();
  engine_type engine(queue, 1);
  const auto failure = [](auto call) { return message_of<tarn::computation_error>(call); };
  const std::string load =
      "kestrel::tarn::rng::load_state: computation error: failed to load state ";
  EXPECT_EQ(failure([&] { rng::load_state<engine_type>(queue, std::string("no/such/file")); }),
            load + "from the file");
  EXPECT_EQ(failure([&] { rng::save_state(engine, std::string("no/such/folder/file")); }),
            "kestrel::tarn::rng::save_state: computation error: failed to save state to the file");
  std::vector<std::uint8_t> image(static_cast<std::size_t>(rng::get_state_size(engine)));
  rng::save_state(engine, image.data());
  image[4] = 2;  // the mark of a valid stream
  EXPECT_EQ(failure([&] { rng::load_state<engine_type>(queue, image.data()); }),
            load + "from the memory");
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
