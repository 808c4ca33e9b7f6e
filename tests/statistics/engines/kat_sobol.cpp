// SPDX-License-Identifier: Apache-2.0
// sobol against published points and direction words, the default ones and older ones as a user's.
#include "net_answers.hpp"

namespace {

using kat_sobol = support::on_simd_target;

constexpr std::uint32_t all_dims = 3667;

TEST_F(kat_sobol, points) {
  support::compare_points(RVX_BRNG_SOBOL, "sobol_joekuo", all_dims, 48);
}

TEST(kat_sobol_directions, of_listed_dimensions_and_hash_of_all) {
  support::compare_directions(RVX_BRNG_SOBOL, "sobol_joekuo_directions", all_dims, 34);
}

// The 40 dimensions of Algorithm 659, which has other direction numbers and 30 bits: the words
// v_1, ..., v_6 come from the published points 2^k, whose Gray code has the bits k and k - 1; the
// other published points have to follow from them.
TEST_F(kat_sobol, points_of_other_direction_numbers) {
  constexpr std::size_t dims = 40, bits = 30;
  std::vector<std::uint32_t> seed(3 + 32 * dims);
  seed[0] = dims;
  seed[1] = 1;
  seed[2] = 4;
  const auto lines = tarn::kat::read_file(TARN_KAT_FOLDER, "sobol_gsl_toms659");
  const auto index_of = [](const tarn::kat::line& l) { return std::stoull(l.fields.at(1)); };
  std::size_t known = 0;
  for (const tarn::kat::line& next : lines) {
    ASSERT_EQ(next.fields.at(0), "point");
    const auto point = tarn::kat::answers(next, 3, 10);
    ASSERT_EQ(point.size(), dims);
    if (index_of(next) != std::uint64_t{1} << known)
      continue;
    for (std::size_t d = 0; d < dims; ++d) {
      std::uint32_t* v = &seed[3 + 32 * d];
      v[known] = point[d] << (32 - bits) ^ (known == 0 ? 0 : v[known - 1]);
    }
    ++known;
  }
  ASSERT_GE(known, 6u);

  std::size_t compared = 0;
  for (const tarn::kat::line& next : lines) {
    const std::uint64_t index = index_of(next);
    if (index >= std::uint64_t{1} << known)
      continue;  // needs a word that no point tells
    support::any_stream s(RVX_BRNG_SOBOL, seed);
    const auto drawn = s.words(static_cast<std::size_t>(index) * dims);
    const auto point = tarn::kat::answers(next, 3, 10);
    for (std::size_t d = 0; d < dims; ++d)
      EXPECT_EQ(drawn[(index - 1) * dims + d], point[d] << (32 - bits))
          << "line " << next.number << ", dimension " << d + 1;
    ++compared;
  }
  EXPECT_GT(compared, known);
}

}  // namespace
