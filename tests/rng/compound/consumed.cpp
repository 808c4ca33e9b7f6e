// SPDX-License-Identifier: Apache-2.0
// The count of words that generate_ex returns is what the engine has moved by: for every engine
// with a device road, every row of a rejecting or compound family and every road of its parameters,
// the words behind the call are those of the serial sequence behind that many, on the device and in
// the stream that the engine is saved by.
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <kestrel/tarn/rng/device_level.hpp>

#include <gtest/gtest.h>

#include "compound_cases.hpp"
#include "every_engine.hpp"
#include "in_flight.hpp"

namespace {

namespace detail = kestrel::tarn::rng::detail;
using namespace tarn_test;
using reals = std::vector<double>;

/// What generate_ex returns for n results of a case; both output forms.
template <typename Distr, typename Engine>
std::int64_t words_of_call(const compound_case<Distr>& drawn, Engine& engine, std::int64_t n,
                           bool into_buffer) {
  using T = typename Distr::result_type;
  sycl::queue& queue = engine.get_queue();
  auto* const impl = detail::engine_access::impl(engine);
  const auto size = static_cast<std::size_t>(n * drawn.width) + guard_size;
  const results<T> out(queue, size);
  std::pair<sycl::event, std::int64_t> returned;
  if (into_buffer) {
    sycl::buffer<T, 1> buffer(out.get(), sycl::range<1>(size));
    returned = detail::gpu::generate_ex<Engine, Distr>(queue, drawn.distr, impl, n, buffer, {});
  } else {
    returned = detail::gpu::generate_ex<Engine, Distr>(queue, drawn.distr, impl, n, out.get(), {});
  }
  returned.first.wait_and_throw();
  if (n > 0) {
    EXPECT_FALSE(out.untouched());
  }
  for (std::size_t i = size - guard_size; i < size; ++i) {
    EXPECT_TRUE(same_bits(out.get()[i], marker<T>())) << "stray store";
  }
  return returned.second;
}

template <typename Engine>
class consumed_words : public testing::Test {
 protected:
  using gpu_case = engine_case<Engine, detail::device_type::gpu>;
  static constexpr std::int64_t most = 200'000, next_words = 5;

  /// Calls for n results behind `first` words.
  template <typename Distr>
  void expect_movement(const compound_case<Distr>& drawn, std::int64_t n, std::int64_t first) {
    SCOPED_TRACE(drawn.road + ", " + std::to_string(n) + " behind " + std::to_string(first));
    Engine engine = gpu_case::make();
    next(engine, first);
    const std::int64_t words = words_of_call(drawn, engine, n, (n + first) % 2 != 0);
    if (drawn.words != by_rejection) {
      EXPECT_EQ(words, drawn.words);
    } else {
      EXPECT_GE(words, 2 * n);
      EXPECT_EQ(words % 2, 0);
    }
    ASSERT_LE(first + words + next_words, most);
    const auto place = sequence_.begin() + first + words;
    const reals behind(place, place + next_words);
    const image saved = image_of(engine);
    EXPECT_EQ(next(engine, next_words), behind) << "on the device";
    Engine loaded = rng::load_state<Engine>(cpu_queue(), saved.data());
    EXPECT_EQ(next(loaded, next_words), behind) << "in the stream";
  }

  const reals sequence_ = serial<engine_case<Engine>>(0, most);
};
using device_road_engines = testing::Types<rng::philox4x32x10, rng::mrg32k3a, rng::mcg31m1,
                                           rng::mcg59, rng::mt19937, rng::mt2203, rng::sobol>;

struct name_of_engine {
  template <typename Engine>
  static std::string GetName(int) {
    return detail::engine_row<Engine>::name;
  }
};
TYPED_TEST_SUITE(consumed_words, device_road_engines, name_of_engine);

TYPED_TEST(consumed_words, are_those_that_the_engine_has_moved_by) {
  int rows = 0;
  for_every_compound_row([&](auto row, const std::string& text) {
    using Distr = typename decltype(row)::type;
    SCOPED_TRACE(text);
    ++rows;
    for (const std::int64_t n : {0, 1, 6, 19}) {
      for (const auto& drawn : compound_cases<Distr>::all(n)) {
        this->expect_movement(drawn, n, n == 6 ? 3 : 0);
      }
    }
  });
  EXPECT_EQ(rows, 38);
}

// The passes of calls of 10000 results and more have another capacity, and their last ones few
// candidates.
TYPED_TEST(consumed_words, of_long_calls_are_those_of_all_passes) {
  for (const std::int64_t n : {9999, 10001}) {
    for (const auto& drawn : compound_cases<rng::gamma<float>>::all(n)) {
      this->expect_movement(drawn, n, 1);
    }
    for (const auto& drawn : compound_cases<rng::binomial<>>::all(n)) {
      this->expect_movement(drawn, n, 2);
    }
  }
}

// Calls follow each other without a gap, whatever the passes of each.
TYPED_TEST(consumed_words, of_calls_add_up) {
  TypeParam engine = TestFixture::gpu_case::make();
  std::int64_t words = 0;
  for (int round = 0; round < 3; ++round) {
    for (const std::int64_t n : {3, 8}) {
      for (const auto& drawn : compound_cases<rng::hypergeometric<>>::all(n)) {
        words += words_of_call(drawn, engine, n, round == 1);
      }
      for (const auto& drawn : compound_cases<rng::chi_square<double>>::all(n)) {
        words += words_of_call(drawn, engine, n, round == 1);
      }
    }
  }
  EXPECT_GT(words, 500);
  const auto place = this->sequence_.begin() + words;
  EXPECT_EQ(next(engine, 5), reals(place, place + 5));
}

}  // namespace
