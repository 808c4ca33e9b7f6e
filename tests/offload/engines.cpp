// SPDX-License-Identifier: Apache-2.0
// Every routine on every engine with a GPU path: results are those of `generate` from the place of
// the caller's stream, and the host goes on with the stream where that engine would. In double
// precision: that of single precision differs in nothing but the type, and is in names.cpp.
#include "engines.hpp"

#include <string>
#include <vector>

#include "drawn.hpp"

namespace {

using namespace tarn_test;

template <typename Engine>
class offload_routines : public testing::Test {
 protected:
  void TearDown() override { EXPECT_EQ(omptarget::mistakes(), 0); }

  template <typename Drawing>
  void expect_results_and_place(const Drawing& drawn, std::int64_t n, std::int64_t first) {
    SCOPED_TRACE(text_of(drawn) + ", " + std::to_string(n) + " from " + std::to_string(first));
    caller_stream stream = offload_engine<Engine>::at(first);
    Engine engine = engine_at<Engine>(stream);
    const auto expected = draw(drawn.distr, engine, n, static_cast<std::size_t>(drawn.width));
    EXPECT_EQ(draw_wide(drawn, stream, n, interop_), expected);
    EXPECT_EQ(stream.reals(5), draw(rng::uniform<double>(-1, 1), engine, 5)) << "behind the call";
  }

  const gpu_interop interop_{common_queue()};
};
TYPED_TEST_SUITE(offload_routines, offload_engines, offload_engine_name);

template <typename Drawing>
constexpr bool wants_fair_bits =
    std::is_same_v<typename Drawing::entries, offload::viUniformBits32> ||
    std::is_same_v<typename Drawing::entries, offload::viUniformBits64>;

TYPED_TEST(offload_routines, go_on_with_the_callers_stream) {
  using row = offload_engine<TypeParam>;
  int drawings = 0;
  for (const std::int64_t n : {1, 20, 333}) {
    const auto expect = [&](const auto& drawn) {
      if constexpr (row::uniform_bits || !wants_fair_bits<std::decay_t<decltype(drawn)>>) {
        ++drawings;
        this->expect_results_and_place(drawn, n, n == 20 ? row::places()[2] : 0);
      }
    };
    for_every_real_drawing<double>(expect);
    for_every_integer_drawing(n, expect);
    expect(raw_words(row::stored_words));
  }
  EXPECT_GT(drawings, 3 * 25);
}

TYPED_TEST(offload_routines, start_anywhere) {
  using row = offload_engine<TypeParam>;
  ASSERT_GE(row::places().size(), 5u);
  for (const std::int64_t first : row::places()) {
    for (const std::int64_t n : {1, 5, 1000}) {
      this->expect_results_and_place(raw_words(row::stored_words), n, first);
      for_every_gaussian<double>(
          [&](const auto& drawn) { this->expect_results_and_place(drawn, n, first); });
      for_every_accurate_pair<double>(
          [&](const auto& drawn) { this->expect_results_and_place(drawn, n, first); });
    }
  }
}

// Passes of calls of 10000 results and more are others.
TYPED_TEST(offload_routines, of_rejecting_families_move_by_the_words_of_all_passes) {
  const auto expect = [this](const auto& drawn) {
    if (drawn.words == taken::by_rejection) {
      this->expect_results_and_place(drawn, 10001, 1);
    }
  };
  for_every_real_drawing<double>(expect);
  for_every_integer_drawing(10001, expect);
}

}  // namespace
