// SPDX-License-Identifier: Apache-2.0
// What a call on a GPU takes from the sequence, for every family with a fixed number of words: n
// results move the engine by n times the words of one, whatever is left over of a block or a pair;
// and where results do not stand in pairs, calls can be cut anywhere.
#include <cstdint>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "device_engines.hpp"
#include "drawing.hpp"
#include "frame/checks.hpp"
#include "frame/rows.hpp"
#include "queues.hpp"
#include "routine_samples.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using rng::detail::distribution_row;
using rng::detail::engine_row;
using tarn_test::cpu_queue;
using tarn_test::draw;
using tarn_test::gpu_queue;
using words = std::vector<std::uint32_t>;

constexpr std::uint32_t seed = 77;

/// On both roads the same serial sequence: the family of mt2203 as one member of it.
template <typename Engine>
Engine serial(const sycl::queue& queue) {
  if constexpr (std::is_same_v<Engine, rng::mt2203>) {
    return Engine(queue, seed, 0);
  } else {
    return Engine(queue, seed);
  }
}

template <typename Engine>
words draw_words(Engine& engine, std::int64_t n) {
  return draw(rng::bits<>(), engine, n, static_cast<std::size_t>(engine_row<Engine>::stored_words));
}

/// Values of a result; only words of 59 bits fill two.
template <typename Engine, typename Distr>
constexpr std::size_t values_of_result() {
  return std::is_same_v<Distr, rng::bits<>>
             ? static_cast<std::size_t>(engine_row<Engine>::stored_words)
             : 1;
}

/// Results that are two halves of one pair of words.
template <typename Distr>
inline constexpr bool stand_in_pairs = false;
template <typename T>
inline constexpr bool stand_in_pairs<rng::gaussian<T, rng::gaussian_method::box_muller2>> = true;
template <typename T>
inline constexpr bool stand_in_pairs<rng::lognormal<T, rng::lognormal_method::box_muller2>> = true;

template <typename Engine, typename Distr>
void expect_words_taken() {
  constexpr auto per_result = static_cast<std::int64_t>(distribution_row<Distr>::per_output_words);
  constexpr std::int64_t most = 13;
  Engine host = serial<Engine>(cpu_queue());
  const words run = draw_words(host, most * per_result + 3);
  constexpr auto stored = static_cast<std::ptrdiff_t>(engine_row<Engine>::stored_words);
  for (std::int64_t n = 0; n <= most; ++n) {
    const Distr distr = tarn_test::sample<Distr>::make(n);
    Engine engine = serial<Engine>(gpu_queue());
    draw(distr, engine, n, values_of_result<Engine, Distr>());
    const auto next = run.begin() + n * per_result * stored;
    ASSERT_EQ(draw_words(engine, 3), words(next, next + 3 * stored)) << "after " << n << " results";
  }
}

template <typename Engine, typename Distr>
void expect_cuts_to_agree() {
  constexpr std::int64_t total = 9;
  constexpr std::size_t values = values_of_result<Engine, Distr>();
  const Distr distr = tarn_test::sample<Distr>::make(total);
  Engine whole_engine = serial<Engine>(gpu_queue());
  const auto whole = draw(distr, whole_engine, total, values);
  for (std::int64_t first = 0; first <= total; ++first) {
    Engine engine = serial<Engine>(gpu_queue());
    auto parts = draw(distr, engine, first, values);
    const auto rest = draw(distr, engine, total - first, values);
    parts.insert(parts.end(), rest.begin(), rest.end());
    ASSERT_EQ(parts, whole) << "cut at " << first;
  }
}

template <typename Engine, typename Distr>
void check_row(int& rows) {
  if constexpr (distribution_row<Distr>::gpu && !rng::detail::is_refused<Distr, Engine> &&
                distribution_row<Distr>::entry == rng::detail::device_entry::generate) {
    ++rows;
    expect_words_taken<Engine, Distr>();
    if constexpr (!stand_in_pairs<Distr>) {
      expect_cuts_to_agree<Engine, Distr>();
    }
  }
}

template <typename Engine>
class functor_call : public testing::Test {};
TYPED_TEST_SUITE(functor_call, tarn_test::device_engines, tarn_test::engine_name);
TARN_REPORTS_CUDA(functor_call)

TYPED_TEST(functor_call, takes_its_words_and_can_be_cut) {
  using namespace rng;
  using rng::gamma;  // <math.h> has one as well
  int rows = 0;
#define TARN_CHECK(...)       \
  SCOPED_TRACE(#__VA_ARGS__); \
  check_row<TypeParam, __VA_ARGS__>(rows);
#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) {TARN_CHECK type}
#include "distributions/distributions.def"
  EXPECT_GE(rows, 40);
}

// A pair that a call leaves half done is dropped: the next call pairs the words that follow.
TYPED_TEST(functor_call, an_odd_count_changes_the_pairs_behind_it) {
  const rng::gaussian<double, rng::gaussian_method::box_muller2> distr;
  TypeParam whole_engine = serial<TypeParam>(gpu_queue());
  const auto whole = draw(distr, whole_engine, 6);
  TypeParam engine = serial<TypeParam>(gpu_queue());
  const auto first = draw(distr, engine, 3);
  const auto second = draw(distr, engine, 3);
  EXPECT_EQ(first, std::vector<double>(whole.begin(), whole.begin() + 3));
  for (std::size_t i = 0; i < 3; ++i) {
    EXPECT_NE(second[i], whole[3 + i]) << i;
  }
  // They are those of an engine that stands behind three words.
  TypeParam behind = serial<TypeParam>(gpu_queue());
  draw_words(behind, 3);
  EXPECT_EQ(second, draw(distr, behind, 3));
}

}  // namespace
