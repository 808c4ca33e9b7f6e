// SPDX-License-Identifier: Apache-2.0
// The words of mcg59 against published answers.
#include "multiplicative_answers.hpp"

namespace {

using kat = support::on_simd_target;

TEST_F(kat, published_words_skipped_to_and_drawn) {
  multiplicative::expect_answers("mcg59", RVX_BRNG_MCG59, 2, 6);
}

}  // namespace
