// SPDX-License-Identifier: Apache-2.0
// The proofs that the table of Mersenne twisters rests on, against the answers of the authors of
// dynamic creation and the published dimensions of MT19937.
#include <map>

#include <gtest/gtest.h>

#include "../kat/kat_file.hpp"
#include "mt2203/decimation.hpp"
#include "mt2203/equidistribution.hpp"
#include "mt2203/irreducible.hpp"
#include "mt2203/sieve.hpp"

namespace {

using namespace tarn::mt2203;

// The published sets by id: lines "id I a A b B c C".
std::map<std::size_t, parameters> published_sets() {
  std::map<std::size_t, parameters> sets;
  for (const tarn::kat::line& next : tarn::kat::read_file(TARN_KAT_FOLDER, "mt2203"))
    if (next.fields.at(0) == "id") {
      const auto word = [&](std::size_t at) {
        return tarn::kat::words(next, at, at + 1, 16).at(0);
      };
      sets[std::stoul(next.fields.at(1))] = {word(3), word(5), word(7)};
    }
  return sets;
}

// The ids whose sets are known to be spoilt by this bit.
constexpr std::size_t spoilt_sets = 8;
constexpr std::uint32_t spoiling_bit = 0x00010000;

TEST(kat_mt2203, published_matrix_words_have_the_full_period_and_spoilt_ones_have_not) {
  const auto sets = published_sets();
  ASSERT_EQ(sets.size(), 32u);
  const small_factor_sieve sieve;
  for (const auto& [id, set] : sets) {
    EXPECT_EQ(set.a & 0xFFFF, id);
    EXPECT_TRUE(sieve.passes(set.a)) << id;
    EXPECT_TRUE(irreducible(set.a)) << id;
    if (id < spoilt_sets) {
      EXPECT_FALSE(irreducible(set.a ^ spoiling_bit)) << id;
    }
    EXPECT_FALSE(irreducible(set.a & 0x7FFFFFFF)) << id;
  }
}

TEST(kat_mt2203, inversive_decimation_says_the_same) {
  const auto sets = published_sets();
  ASSERT_EQ(sets.size(), 2 * decimation_lanes);
  std::array<std::uint32_t, decimation_lanes> good{}, mixed{};
  for (std::size_t i = 0; i < decimation_lanes; ++i) {
    good[i] = sets.at(i).a;
    mixed[i] = i < spoilt_sets ? sets.at(i).a ^ spoiling_bit : sets.at(decimation_lanes + i).a;
  }
  mixed[decimation_lanes - 1] &= 0x7FFFFFFF;
  const auto good_proved = irreducible_by_decimation(good);
  const auto mixed_proved = irreducible_by_decimation(mixed);
  for (std::size_t i = 0; i < decimation_lanes; ++i) {
    EXPECT_TRUE(good_proved[i]) << i;
    EXPECT_EQ(mixed_proved[i], i >= spoilt_sets && i != decimation_lanes - 1) << i;
  }
}

void expect_dimensions(const tarn::kat::line& from, std::size_t first,
                       const equidistribution& measured) {
  const auto known = tarn::kat::answers(from, first, 10);
  ASSERT_EQ(known.size(), 32u) << "line " << from.number;
  for (std::size_t v = 1; v <= 32; ++v)
    EXPECT_EQ(static_cast<std::uint32_t>(measured.k[v]), known[v - 1])
        << "line " << from.number << ", v = " << v;
}

TEST(kat_mt2203, dimensions_of_equidistribution) {
  const auto sets = published_sets();
  std::size_t sets_seen = 0, mt19937_seen = 0;
  for (const tarn::kat::line& next : tarn::kat::read_file(TARN_KAT_FOLDER, "mt2203")) {
    if (next.fields.at(0) != "kv")
      continue;
    if (next.fields.at(1) == "mt19937") {
      // Matsumoto and Nishimura, "Mersenne Twister", ACM TOMACS 8(1), 1998, table II.
      const twister_shape mt19937{624, 397, 31, 11, 7, 15};
      expect_dimensions(next, 3,
                        measure_equidistribution(mt19937, {0x9908B0DF, 0x9D2C5680, 0xEFC60000}));
      ++mt19937_seen;
    } else {
      const parameters& set = sets.at(std::stoul(next.fields.at(2)));
      const equidistribution measured = measure_equidistribution(mt2203_shape, set);
      expect_dimensions(next, 6, measured);
      EXPECT_EQ(measured.defect, std::stoi(next.fields.at(4))) << "line " << next.number;
      ++sets_seen;
    }
  }
  EXPECT_EQ(sets_seen, 32u);
  EXPECT_EQ(mt19937_seen, 1u);
}

}  // namespace
