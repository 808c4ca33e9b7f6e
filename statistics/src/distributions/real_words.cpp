// SPDX-License-Identifier: Apache-2.0
// The word-to-real rules.
#include "distributions/real_words.hpp"

namespace tarn::statistics {

namespace {

template <class Real>
affine<Real> centered_map(Real lo, Real hi) {
  return {(hi - lo) * static_cast<Real>(0x1p-32), (lo + hi) * static_cast<Real>(0.5)};
}

}  // namespace

const word_rule signed_word_rule = {
    centered_map<float>,
    centered_map<double>,
    signed_words_to_float,
    signed_words_to_double,
};

}  // namespace tarn::statistics
