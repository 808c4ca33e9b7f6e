// SPDX-License-Identifier: Apache-2.0
// Dimensions of equidistribution against their definition: ranks of matrices over GF(2).
#include <bitset>
#include <vector>

#include <gtest/gtest.h>

#include "mt2203/masks.hpp"
#include "mt2203/member.hpp"
#include "mt2203/table_file.hpp"

namespace {

using namespace tarn::mt2203;

constexpr std::size_t state_bits = 2203;
using row = std::bitset<state_bits>;

// The outputs of a state, by the recurrence as the paper writes it.
std::vector<std::uint32_t> outputs(const parameters& member, std::vector<std::uint32_t> x,
                                   std::size_t count) {
  std::vector<std::uint32_t> result;
  for (std::size_t k = 0; k < count; ++k) {
    const std::uint32_t y = (x[k] & 0xFFFFFFE0) | (x[k + 1] & 0x1F);
    std::uint32_t z = x[k + 34] ^ y >> 1 ^ (y % 2 == 1 ? member.a : 0);
    x.push_back(z);
    z ^= z >> 12;
    z ^= z << 7 & member.b;
    z ^= z << 15 & member.c;
    z ^= z >> 18;
    result.push_back(z);
  }
  return result;
}

// The upper v bits of k outputs as linear functions of the state: are they independent?
bool independent(const parameters& member, int k, int v) {
  const auto count = static_cast<std::size_t>(k), width = static_cast<std::size_t>(v);
  std::vector<row> rows(count * width);
  for (std::size_t bit = 0; bit < state_bits; ++bit) {
    std::vector<std::uint32_t> state(69);
    state[(bit + 5) / 32] = std::uint32_t{1} << (bit + 5) % 32;  // not the 5 lower bits of word 0
    const std::vector<std::uint32_t> out = outputs(member, state, count);
    for (std::size_t i = 0; i < rows.size(); ++i)
      rows[i][bit] = (out[i / width] >> (31 - i % width) & 1) != 0;
  }
  for (std::size_t i = 0; i < rows.size(); ++i) {
    const std::size_t pivot = rows[i]._Find_first();
    if (pivot == state_bits)
      return false;
    for (std::size_t j = i + 1; j < rows.size(); ++j)
      if (rows[j][pivot])
        rows[j] ^= rows[i];
  }
  return true;
}

TEST(equidistribution, is_the_largest_dimension_without_dependence) {
  const parameters member = read_table(TARN_MT2203_TABLE).at(4321);
  for (const int v : {1, 3, 6, 11, 17, 32}) {
    const int k = dimension_of_equidistribution(mt2203_shape, member, v);
    EXPECT_TRUE(independent(member, k, v)) << "v = " << v;
    EXPECT_FALSE(independent(member, k + 1, v)) << "v = " << v;
  }
}

// The dimensions that the search notes on its way are those of the masks it ends with.
TEST(find_masks, tells_what_its_masks_have) {
  for (const std::size_t id : {0u, 3000u, 6023u}) {
    const parameters member = read_table(TARN_MT2203_TABLE).at(id);
    const tempered found = find_masks(member.a);
    EXPECT_EQ(found.member, member);
    const equidistribution measured = measure_equidistribution(mt2203_shape, member);
    EXPECT_EQ(found.quality.k, measured.k);
    EXPECT_EQ(found.quality.defect, measured.defect);
  }
}

TEST(acceptable, refuses_what_misses_a_bound) {
  const equidistribution good =
      measure_equidistribution(mt2203_shape, read_table(TARN_MT2203_TABLE).at(0));
  EXPECT_TRUE(acceptable(good));
  const auto with = [&](std::size_t v, int k, int defect) {
    equidistribution changed = good;
    changed.k[v] = k;
    changed.defect = defect;
    return changed;
  };
  EXPECT_TRUE(acceptable(with(32, 68, highest_defect)));
  EXPECT_FALSE(acceptable(with(1, 2202, good.defect)));
  EXPECT_FALSE(acceptable(with(2, 1100, good.defect)));
  EXPECT_FALSE(acceptable(with(32, 67, good.defect)));
  EXPECT_FALSE(acceptable(with(32, 68, highest_defect + 1)));
}

TEST(candidate, order_visits_every_word_once) {
  for (const std::uint32_t id : {0u, 1u, 6023u}) {
    std::vector<bool> seen(candidates);
    for (std::uint32_t number = 0; number < candidates; ++number) {
      const std::uint32_t a = candidate(id, number);
      EXPECT_EQ(a & 0x8000FFFF, 0x80000000u | id);
      EXPECT_FALSE(seen[a >> 16 & 0x7FFF]) << number;
      seen[a >> 16 & 0x7FFF] = true;
    }
  }
}

}  // namespace
