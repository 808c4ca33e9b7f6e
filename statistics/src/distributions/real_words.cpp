// SPDX-License-Identifier: Apache-2.0
// The word-to-real rules.
#include "distributions/real_words.hpp"

namespace tarn::statistics {

namespace {

template <class Real>
affine<Real> centered_map(Real lo, Real hi) {
  return {(hi - lo) * static_cast<Real>(0x1p-32), (lo + hi) * static_cast<Real>(0.5)};
}

// Words of `Bits` bits as fractions.
template <class Real, int Bits>
affine<Real> binary_map(Real lo, Real hi) {
  constexpr auto unit = static_cast<Real>(1) / static_cast<Real>(std::uint64_t{1} << Bits);
  return {(hi - lo) * unit, lo};
}

affine<float> mrg32k3a_float(float lo, float hi) {
  return {(hi - lo) / 4294967040.0f, lo};
}
affine<double> mrg32k3a_double(double lo, double hi) {
  return {(hi - lo) / 4294967087.0, lo};
}

affine<double> mcg31m1_double(double lo, double hi) {
  return {(hi - lo) / 2147483647.0, lo};
}

}  // namespace

const word_rule signed_word_rule = {
    centered_map<float>,
    centered_map<double>,
    signed_words_to_float,
    signed_words_to_double,
};

const word_rule unsigned_word_rule = {
    binary_map<float, 32>,
    binary_map<double, 32>,
    unsigned_words_to_float,
    unsigned_words_to_double,
};

const word_rule mrg32k3a_word_rule = {
    mrg32k3a_float,
    mrg32k3a_double,
    unsigned_words_to_float,
    unsigned_words_to_double,
};

const word_rule mcg31m1_word_rule = {
    binary_map<float, 31>,
    mcg31m1_double,
    unsigned_words_to_float,
    unsigned_words_to_double,
};

const word_rule mcg59_word_rule = {
    binary_map<float, 59>,
    binary_map<double, 59>,
    wide_words_to_float,
    wide_words_to_double,
};

}  // namespace tarn::statistics
