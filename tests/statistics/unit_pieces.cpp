// SPDX-License-Identifier: Apache-2.0
// Long calls are cut into pieces that a 32-bit count holds.
#include <numeric>
#include <vector>

#include <gtest/gtest.h>

#include "pieces.hpp"

namespace {

using tarn::rvx::in_pieces;

struct recorder {
  std::vector<std::pair<int, std::ptrdiff_t>> calls;
  const int* base;
  int fail_at = -1;

  int operator()(int count, const int* r) {
    calls.emplace_back(count, r - base);
    return static_cast<int>(calls.size()) - 1 == fail_at ? -77 : 0;
  }
};

using calls = std::vector<std::pair<int, std::ptrdiff_t>>;

int run(recorder& record, std::int64_t n, std::int64_t piece, int* r, int width = 1) {
  record.base = r;
  return in_pieces(n, r, width, piece, [&](int count, int* to) { return record(count, to); });
}

TEST(pieces, cover_the_results_in_order) {
  std::vector<int> r(100);
  recorder even, odd, one, none;
  EXPECT_EQ(run(even, 100, 25, r.data()), 0);
  EXPECT_EQ(even.calls, (calls{{25, 0}, {25, 25}, {25, 50}, {25, 75}}));
  EXPECT_EQ(run(odd, 100, 33, r.data()), 0);
  EXPECT_EQ(odd.calls, (calls{{33, 0}, {33, 33}, {33, 66}, {1, 99}}));
  EXPECT_EQ(run(one, 100, 100, r.data()), 0);
  EXPECT_EQ(one.calls, (calls{{100, 0}}));
  EXPECT_EQ(run(none, 0, 100, r.data()), 0);
  EXPECT_TRUE(none.calls.empty());
}

TEST(pieces, results_of_two_values) {
  std::vector<int> r(100);
  recorder record;
  EXPECT_EQ(run(record, 50, 20, r.data(), 2), 0);
  EXPECT_EQ(record.calls, (calls{{20, 0}, {20, 40}, {10, 80}}));
}

TEST(pieces, stop_at_the_first_failure) {
  std::vector<int> r(100);
  recorder record;
  record.fail_at = 1;
  EXPECT_EQ(run(record, 100, 30, r.data()), -77);
  EXPECT_EQ(record.calls, (calls{{30, 0}, {30, 30}}));
}

TEST(pieces, counts_beyond_32_bits) {
  // The results are not touched, so a pretended array of 5 * 2^30 bytes does.
  char base = 0;
  std::vector<int> counts;
  const std::int64_t n = std::int64_t{5} << 30;
  EXPECT_EQ(in_pieces(n, &base, 1, tarn::rvx::largest_piece,
                      [&](int count, char*) {
                        counts.push_back(count);
                        return 0;
                      }),
            0);
  EXPECT_EQ(counts, (std::vector<int>{0x7FFFFFFF, 0x7FFFFFFF, 0x40000002}));
}

}  // namespace
