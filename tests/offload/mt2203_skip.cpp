// SPDX-License-Identifier: Apache-2.0
// A skip of an mt2203 stream leaves, byte by byte, the record that drawing leaves.
#include "offload/mt2203_skip.hpp"

#include <cstdint>
#include <string>
#include <vector>

#include "caller_stream.hpp"

namespace {

using kestrel::tarn::rng::detail::openmp::skip_mt2203;
using tarn_test::caller_stream;

void expect_skips(caller_stream& stream, std::int64_t words) {
  caller_stream drawn(stream);
  const caller_stream skipped(stream);
  drawn.pass(words);
  skip_mt2203(skipped, words);
  ASSERT_EQ(skipped.image(), drawn.image()) << words;
}

TEST(mt2203_skip, is_drawing_from_every_position_of_every_length) {
  caller_stream stream(RVX_BRNG_MT2203, {77, 5});
  for (int position = 0; position <= 70; ++position) {
    SCOPED_TRACE("from " + std::to_string(position));
    for (std::int64_t words = 1; words <= 3 * 69 + 1; ++words) {
      ASSERT_NO_FATAL_FAILURE(expect_skips(stream, words));
    }
    stream.pass(1);
  }
}

TEST(mt2203_skip, is_drawing_for_long_counts_and_other_members) {
  for (const std::int64_t member : {0, 1, 4711, 6023}) {
    caller_stream stream(RVX_BRNG_MT2203 + member, {3});
    for (const std::int64_t words : {1000, 69 * 1000 - 1, 69 * 1000, 69 * 1000 + 1, 1000003}) {
      ASSERT_NO_FATAL_FAILURE(expect_skips(stream, words));
      stream.pass(13);
    }
  }
}

TEST(mt2203_skip, below_one_does_nothing) {
  for (const std::int64_t first : {0, 1, 69}) {
    caller_stream stream(RVX_BRNG_MT2203, {3});
    stream.pass(first);
    const auto before = stream.image();
    for (const std::int64_t words : {std::int64_t{0}, std::int64_t{-1}, INT64_MIN}) {
      skip_mt2203(stream, words);
      EXPECT_EQ(stream.image(), before) << words;
    }
  }
}

TEST(mt2203_skip, adds_up) {
  caller_stream steps(RVX_BRNG_MT2203, {9});
  const caller_stream whole(steps);
  std::int64_t sum = 0;
  for (std::int64_t words = 0; words < 500; words += 7) {
    skip_mt2203(steps, words);
    sum += words;
  }
  skip_mt2203(whole, sum);
  EXPECT_EQ(steps.image(), whole.image());
}

}  // namespace
