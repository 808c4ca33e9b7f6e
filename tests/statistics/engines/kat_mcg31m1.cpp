// SPDX-License-Identifier: Apache-2.0
// The words of mcg31m1 against published answers.
#include "multiplicative_answers.hpp"

namespace {

using kat = support::on_simd_target;

TEST_F(kat, published_words_skipped_to_and_drawn) {
  multiplicative::expect_answers("mcg31m1", RVX_BRNG_MCG31, 1, 9);
}

}  // namespace
