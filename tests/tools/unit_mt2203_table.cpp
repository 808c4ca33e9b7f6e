// SPDX-License-Identifier: Apache-2.0
// The table of Mersenne twisters that is checked in: complete, in order, and a sample of it proved
// anew. `mt2203_table --verify` proves all of it.
#include <algorithm>
#include <random>
#include <set>

#include <gtest/gtest.h>

#include "mt2203/decimation.hpp"
#include "mt2203/equidistribution.hpp"
#include "mt2203/table_file.hpp"

namespace {

using namespace tarn::mt2203;

TEST(mt2203_table, rows_are_complete_and_in_order) {
  const std::vector<parameters> rows = read_table(TARN_MT2203_TABLE);
  ASSERT_EQ(rows.size(), 6024u);
  std::set<std::uint32_t> distinct;
  for (std::size_t id = 0; id < rows.size(); ++id) {
    EXPECT_EQ(rows[id].a & 0xFFFF, id);
    EXPECT_EQ(rows[id].a >> 31, 1u) << id;
    // The shifts by 7 and 15 bring in zeros there.
    EXPECT_EQ(rows[id].b & 0x7F, 0u) << id;
    EXPECT_EQ(rows[id].c & 0x7FFF, 0u) << id;
    EXPECT_NE(rows[id].b, 0u) << id;
    EXPECT_NE(rows[id].c, 0u) << id;
    distinct.insert(rows[id].a);
  }
  EXPECT_EQ(distinct.size(), rows.size());
}

// The first and the last row, and others.
std::vector<parameters> sample() {
  constexpr std::size_t size = 50;
  std::vector<parameters> rows = read_table(TARN_MT2203_TABLE);
  std::mt19937 random(2203);
  for (std::size_t i = 1; i + 1 < size; ++i)  // draws without repetition
    std::swap(rows.at(i), rows.at(i + random() % (rows.size() - 1 - i)));
  std::swap(rows.at(size - 1), rows.back());
  rows.resize(size);
  return rows;
}

TEST(mt2203_table, sampled_rows_have_the_full_period) {
  const std::vector<parameters> rows = sample();
  ASSERT_EQ(rows.size(), 50u);
  for (std::size_t begin = 0; begin < rows.size(); begin += decimation_lanes) {
    std::array<std::uint32_t, decimation_lanes> a{};
    const std::size_t count = std::min(decimation_lanes, rows.size() - begin);
    for (std::size_t i = 0; i < count; ++i)
      a[i] = rows[begin + i].a;
    const auto proved = irreducible_by_decimation(a);
    for (std::size_t i = 0; i < count; ++i)
      EXPECT_TRUE(proved[i]) << std::hex << a[i];
  }
}

TEST(mt2203_table, sampled_rows_are_well_tempered) {
  for (const parameters& row : sample()) {
    const equidistribution quality = measure_equidistribution(mt2203_shape, row);
    EXPECT_EQ(quality.k[1], 2203) << std::hex << row.a;
    EXPECT_EQ(quality.k[2], 1101) << std::hex << row.a;
    EXPECT_GE(*std::min_element(quality.k.begin() + 1, quality.k.end()), 68) << std::hex << row.a;
    EXPECT_LE(quality.defect, 800) << std::hex << row.a;
    EXPECT_GE(quality.defect, 0) << std::hex << row.a;
  }
}

}  // namespace
