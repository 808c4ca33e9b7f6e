// SPDX-License-Identifier: Apache-2.0
// Every constructor on a CPU queue against a stream made from the same words: the same state.
#include <cstdint>
#include <string>
#include <tarn_rvx.h>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "every_engine.hpp"
#include "message.hpp"
#include "queues.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
using namespace tarn_test;
using words = std::vector<std::uint32_t>;

sycl::queue cpu() {
  return cpu_queue();
}

template <typename Engine>
void expect_state(Engine engine, std::int64_t code, const words& seed) {
  EXPECT_EQ(image_of(engine), plain_stream(code, seed).bytes());
}

template <typename Engine>
void expect_state_of_seed(Engine engine, std::int64_t code, std::uint64_t seed) {
  EXPECT_EQ(image_of(engine), plain_stream(code, seed).bytes());
}

// Above 0x7FFFFFFF a seed travels as two words, the upper one 0 in 32-bit seeds.
constexpr std::uint32_t wide = 0x80000005u;

template <typename Engine>
void expect_narrow_seeds(std::int64_t code) {
  static_assert(std::is_same_v<decltype(Engine::default_seed), const std::uint32_t>);
  static_assert(Engine::default_seed == 1);
  expect_state(Engine(cpu()), code, {1});
  expect_state(Engine(cpu(), 77), code, {77});
  expect_state(Engine(cpu(), wide), code, {wide, 0});
}

TEST(seeds, of_one_word) {
  expect_narrow_seeds<rng::mcg31m1>(RVX_BRNG_MCG31);
  expect_narrow_seeds<rng::r250>(RVX_BRNG_R250);
  expect_narrow_seeds<rng::mrg32k3a>(RVX_BRNG_MRG32K3A);
  expect_narrow_seeds<rng::wichmann_hill>(RVX_BRNG_WH);
  expect_narrow_seeds<rng::mt19937>(RVX_BRNG_MT19937);
  expect_narrow_seeds<rng::mt2203>(RVX_BRNG_MT2203);
  expect_narrow_seeds<rng::sfmt19937>(RVX_BRNG_SFMT19937);
}

template <typename Engine, std::uint64_t default_seed>
void expect_wide_seeds(std::int64_t code) {
  static_assert(std::is_same_v<decltype(Engine::default_seed), const std::uint64_t>);
  static_assert(Engine::default_seed == default_seed);
  expect_state(Engine(cpu()), code, {default_seed});
  expect_state(Engine(cpu(), 77), code, {77});
  expect_state(Engine(cpu(), wide), code, {wide, 0});
  expect_state(Engine(cpu(), 0x9ABCDEF012345678), code, {0x12345678, 0x9ABCDEF0});
}

TEST(seeds, of_two_words) {
  expect_wide_seeds<rng::mcg59, 1>(RVX_BRNG_MCG59);
  expect_wide_seeds<rng::ars5, 0>(RVX_BRNG_ARS5);
  expect_wide_seeds<rng::philox4x32x10, 0>(RVX_BRNG_PHILOX4X32X10);
}

template <typename Engine>
void expect_lists(std::int64_t code) {
  expect_state(Engine(cpu(), {5, 4, 3, 2, wide}), code, {5, 4, 3, 2, wide});
  expect_state(Engine(cpu(), {9}), code, {9});
}

TEST(seeds, in_lists) {
  expect_lists<rng::mrg32k3a>(RVX_BRNG_MRG32K3A);
  expect_lists<rng::mt19937>(RVX_BRNG_MT19937);
  expect_lists<rng::mt2203>(RVX_BRNG_MT2203);
  expect_lists<rng::sfmt19937>(RVX_BRNG_SFMT19937);
  expect_lists<rng::wichmann_hill>(RVX_BRNG_WH);
}

// n items give n words: the first n of the 2n.
TEST(seeds, in_lists_of_64_bit_items) {
  const std::uint64_t item = 0x0000000200000001;
  expect_state(rng::ars5(cpu(), {item}), RVX_BRNG_ARS5, {1});
  expect_state(rng::ars5(cpu(), {item, 3}), RVX_BRNG_ARS5, {1, 2});
  expect_state(rng::ars5(cpu(), {item, 0x0000000400000003, 5}), RVX_BRNG_ARS5, {1, 2, 3});
  expect_state(rng::philox4x32x10(cpu(), {item, 0x0000000400000003, 5}), RVX_BRNG_PHILOX4X32X10,
               {1, 2, 3});
}

TEST(seeds, of_r250_in_a_vector) {
  words seed;
  for (std::uint32_t i = 0; i < 250; ++i) {
    seed.push_back(0x9E3779B9u * (i + 1));
  }
  const words kept = seed;
  expect_state(rng::r250(cpu(), seed), RVX_BRNG_R250, seed);
  EXPECT_EQ(seed, kept);
  expect_state(rng::r250(cpu(), words{3, 4}), RVX_BRNG_R250, {3, 4});
}

template <typename Engine>
void expect_members(std::int64_t code, std::uint32_t members) {
  for (const std::uint32_t idx : {0u, 1u, 100u, members - 1}) {
    expect_state(Engine(cpu(), 77, idx), code + idx, {77});
    expect_state(Engine(cpu(), wide, idx), code + idx, {wide, 0});
    expect_state(Engine(cpu(), {5, 6}, idx), code + idx, {5, 6});
  }
  // Both sets name mt2203; callers compare the text.
  const std::string message =
      "kestrel::tarn::rng::mt2203: invalid argument: engine_idx is out of range [0, " +
      std::to_string(members) + ")";
  for (const std::uint32_t idx : {members, members + 1, ~0u}) {
    EXPECT_EQ(message_of<tarn::invalid_argument>([&] { Engine(cpu(), 77, idx); }), message);
    EXPECT_EQ(message_of<tarn::invalid_argument>([&] { Engine(cpu(), {5, 6}, idx); }), message);
  }
}

TEST(seeds, with_an_index_pick_a_member) {
  expect_members<rng::mt2203>(RVX_BRNG_MT2203, 6024);
  expect_members<rng::wichmann_hill>(RVX_BRNG_WH, 273);
}

template <typename Engine>
void expect_dimensions(std::int64_t code) {
  static_assert(std::is_same_v<decltype(Engine::default_dimensions_number), const std::uint32_t>);
  static_assert(Engine::default_dimensions_number == 1);
  expect_state(Engine(cpu()), code, {1});
  expect_state(Engine(cpu(), 12), code, {12});
}

TEST(seeds, of_quasi_random_engines_are_dimensions) {
  expect_dimensions<rng::sobol>(RVX_BRNG_SOBOL);
  expect_dimensions<rng::niederreiter>(RVX_BRNG_NIEDERR);
}

const std::string not_made =
    "kestrel::tarn::rng::engine initialization: computation error: initialization failure";

// The caller's vector keeps the header that is put in front of it.
TEST(seeds, of_sobol_may_be_direction_numbers) {
  words table;
  for (int dimension = 0; dimension < 2; ++dimension) {
    for (unsigned bit = 0; bit < 32; ++bit) {
      table.push_back(0x80000000u >> bit);
    }
  }
  words headed = {2, 1, 4};
  headed.insert(headed.end(), table.begin(), table.end());
  words given = table;
  rng::sobol engine(cpu(), given);
  EXPECT_EQ(given, headed);
  expect_state(engine, RVX_BRNG_SOBOL, headed);

  words torn(31, 1);
  EXPECT_EQ(message_of<tarn::computation_error>([&] { rng::sobol(cpu(), torn); }), not_made);
  EXPECT_EQ(torn, words(31, 1));
}

TEST(seeds, of_niederreiter_may_be_polynomials) {
  words given = {2, 3, 7};
  rng::niederreiter engine(cpu(), given);
  EXPECT_EQ(given, (words{3, 1, 1, 2, 3, 7}));
  expect_state(engine, RVX_BRNG_NIEDERR, {3, 1, 1, 2, 3, 7});

  words reducible = {2, 5};  // t^2 + 1 = (t + 1)^2
  EXPECT_EQ(message_of<tarn::computation_error>([&] { rng::niederreiter(cpu(), reducible); }),
            not_made);
  EXPECT_EQ(reducible, (words{2, 5}));
}

TEST(seeds, that_no_stream_can_be_made_of_are_refused) {
  EXPECT_EQ(message_of<tarn::computation_error>([] { rng::sobol(cpu(), 100000); }), not_made);
  EXPECT_EQ(message_of<tarn::computation_error>([] { rng::niederreiter(cpu(), 100000); }),
            not_made);
}

TEST(seeds, of_nondeterministic_do_not_exist) {
  static_assert(!std::is_constructible_v<rng::nondeterministic, sycl::queue, std::uint64_t>);
  expect_state_of_seed(rng::nondeterministic(cpu()), RVX_BRNG_NONDETERM, 0);
}

}  // namespace
