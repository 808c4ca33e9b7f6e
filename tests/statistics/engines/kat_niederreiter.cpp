// SPDX-License-Identifier: Apache-2.0
// niederreiter against published points and direction words.
#include "net_answers.hpp"

namespace {

using kat_niederreiter = support::on_simd_target;

constexpr std::uint32_t all_dims = 4720;

TEST_F(kat_niederreiter, points) {
  support::compare_points(RVX_BRNG_NIEDERR, "niederreiter_base2", all_dims, 47);
}

TEST(kat_niederreiter_directions, of_listed_dimensions_and_hash_of_all) {
  support::compare_directions(RVX_BRNG_NIEDERR, "niederreiter_base2_directions", all_dims, 26);
}

}  // namespace
