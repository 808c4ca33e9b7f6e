// SPDX-License-Identifier: Apache-2.0
// The four entries of each routine are one routine: from copies of one stream they give the same
// results, which are those of `generate` on the same queue, and leave the stream at the same place.
#include <set>
#include <string>
#include <vector>

#include "drawn.hpp"
#include "tests/rng/every_engine.hpp"

namespace {

using namespace tarn_test;

constexpr std::int64_t philox = RVX_BRNG_PHILOX4X32X10;

class offload_names : public testing::Test {
 protected:
  void TearDown() override { EXPECT_EQ(omptarget::mistakes(), 0); }

  /// Every entry of one drawing against `generate`.
  template <typename Drawing>
  void expect_the_same_of_each(const Drawing& drawn, std::int64_t n, std::int64_t first) {
    SCOPED_TRACE(text_of(drawn) + ", " + std::to_string(n) + " from " + std::to_string(first));
    caller_stream start(philox, {20261, 4242});
    start.pass(first);
    auto engine = engine_at<rng::philox4x32x10>(start);
    const auto expected = draw(drawn.distr, engine, n, static_cast<std::size_t>(drawn.width));
    const auto place = image_of(engine);
    ASSERT_NE(place, start.image());
    Drawing::entries::each([&](const std::string& form, auto entry) {
      const caller_stream mine(start);
      EXPECT_EQ(draw_by_entry(drawn, entry, mine, n, interop_), expected) << form;
      EXPECT_EQ(mine.image(), place) << form;
      ++calls_;
    });
    routines_.insert(Drawing::entries::routine);
  }

  const gpu_interop interop_{common_queue()};
  std::set<std::string> routines_;
  int calls_ = 0;
};

TEST_F(offload_names, give_what_generate_gives_and_move_the_stream_alike) {
  int drawings = 0;
  for (const std::int64_t n : {1, 19, 1003}) {
    const auto expect = [&](const auto& drawn) {
      ++drawings;
      expect_the_same_of_each(drawn, n, n == 19 ? 3 : 0);
    };
    for_every_drawing(n, expect);
    expect(raw_words(1));
  }
  EXPECT_EQ(routines_.size(), 38u);
  EXPECT_EQ(calls_, 4 * drawings);
}

/// What n results take of the engine.
template <typename Drawing>
std::int64_t words_of(const Drawing& drawn, std::int64_t n) {
  return n * drawn.width * (drawn.words == taken::two_words ? 2 : 1);
}

// The count is that of the host's routine: what the device makes beyond it stays in the sequence.
TEST_F(offload_names, move_the_stream_by_the_words_of_the_results) {
  int counted = 0;
  for (const std::int64_t n : {1, 6, 4099}) {
    for_every_drawing(n, [&](const auto& drawn) {
      if (drawn.words == taken::one_word || drawn.words == taken::two_words) {
        SCOPED_TRACE(text_of(drawn) + ", " + std::to_string(n));
        const caller_stream moved(philox, {7});
        const caller_stream skipped(moved);
        draw_wide(drawn, moved, n, interop_);
        ASSERT_EQ(rvxSkipAheadStream(skipped, words_of(drawn, n)), 0);
        EXPECT_EQ(moved.image(), skipped.image());
        ++counted;
      }
    });
  }
  EXPECT_GT(counted, 3 * 38);
}

// For SYCL and for Level Zero.
TEST_F(offload_names, serve_both_kinds_of_queues_alike) {
  const auto drawn =
      drawing_of<offload::vsUniform>(0, taken::one_word, rng::uniform<float>(2, 3), 2, 3);
  const caller_stream first(philox, {5});
  const caller_stream second(first);
  const gpu_interop level_zero(common_queue(), level_zero_id);
  EXPECT_EQ(draw_wide(drawn, first, 100, interop_), draw_wide(drawn, second, 100, level_zero));
  EXPECT_EQ(first.image(), second.image());
}

// A flag that the object does not have, and one that is there and says no.
TEST_F(offload_names, wait_unless_the_object_says_otherwise) {
  gpu_interop untold(common_queue());
  untold.fail_native(nowait_property, 1);
  const auto drawn = raw_words(1);
  const caller_stream first(philox, {5});
  const caller_stream second(first);
  EXPECT_EQ(draw_wide(drawn, first, 200000, untold), draw_wide(drawn, second, 200000, interop_));
}

}  // namespace
