// SPDX-License-Identifier: Apache-2.0
// The cubic of a segment is the one of least relative error, to the second order. In terms of the
// Chebyshev series a_k T_k of the quotient on the segment, the cut-off series leaves the error
// a_4 T_4 + a_5 T_5; each further coefficient is at most 1/30 of the one before it, since a
// segment is narrow against its distance from the singularity at t = 0. With g = a_1 / a_0, the
// slope of the weight, the relative error of the least possible size is a_4 (T_4 + e (T_5 - T_3)),
// as T_5 = T_3 where |T_4| = 1; comparing terms gives the T_3 that the cubic has to take over:
// a_5 - g a_4 (that equal extremes of changing sign mean the least error: Trefethen,
// Approximation Theory and Approximation Practice, chapter 10).
#include "fit.hpp"

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <vector>

#include <boost/math/constants/constants.hpp>
#include <boost/math/special_functions/erf.hpp>

#include "statistics/common/erfinv_layout.hpp"

namespace erfinv {

namespace {

constexpr std::size_t nodes = 20;  // of the interpolant: error below 30^-20

struct sample {
  exact place, value;  // place in [-1, 1]
};

std::vector<sample> samples(const segment& s) {
  std::vector<sample> all;
  for (std::size_t j = 0; j < nodes; ++j) {
    const exact angle = boost::math::constants::pi<exact>() * (2 * j + 1) / (2 * nodes);
    const exact place = cos(angle);
    all.push_back({place, quotient(s.middle + s.half_width * place)});
  }
  return all;
}

// The first coefficients of the Chebyshev series.
constexpr std::size_t terms = 6;
std::array<exact, terms> series(const std::vector<sample>& at) {
  std::array<exact, terms> a{};
  for (const sample& f : at) {
    exact previous = 1, current = f.place;
    a[0] += f.value / nodes;
    for (std::size_t k = 1; k < terms; ++k) {
      a[k] += f.value * current * 2 / nodes;
      const exact next = 2 * f.place * current - previous;
      previous = current;
      current = next;
    }
  }
  return a;
}

template <class Real, class Bits>
Real real_of(Bits bits) {
  static_assert(sizeof(Real) == sizeof(Bits));
  Real x;
  std::memcpy(&x, &bits, sizeof x);
  return x;
}

}  // namespace

segment float_segment(int row) {
  using namespace tarn::statistics::erfinv_tables;
  const std::int32_t number = float_first_segment - row;
  const auto start = real_of<float>(number << float_segment_shift);
  const auto octave = real_of<float>(number << float_segment_shift & 0x7F800000);
  return {exact(start) + exact(octave) / 16, exact(octave) / 16, octave};
}

segment double_segment(int row) {
  using namespace tarn::statistics::erfinv_tables;
  const std::int64_t number = double_first_segment + row;
  const auto start = real_of<double>(number << double_segment_shift);
  const auto middle = real_of<double>(number << double_segment_shift | double_middle);
  return {middle, middle - start, 1};
}

exact quotient(const exact& t) {
  return boost::math::erfc_inv(t) / (1 - t);
}

template <class Real>
cubic<Real> fit(const segment& s) {
  const std::vector<sample> at = samples(s);
  std::array<exact, terms> a = series(at);
  a[3] += a[5] - a[4] * a[1] / a[0];
  const exact h = s.half_width / s.unit;
  // Each coefficient takes over what the rounding of a higher one left: with u = argument / h,
  // u^3 = (3 T_1 + T_3) / 4 and u^2 = (1 + T_2) / 2, so that the first parts can be made good.
  cubic<Real> result{};
  auto& c = result.coefficients;
  const exact cube = 4 * a[3] / (h * h * h);
  c[3] = cube.convert_to<Real>();
  const exact square = 2 * a[2] / (h * h);
  c[2] = square.convert_to<Real>();
  const exact line = (a[1] - 3 * a[3]) / h + (cube - c[3]) * h * h * 3 / 4;
  c[1] = line.convert_to<Real>();
  const exact start = a[0] - a[2] + (square - c[2]) * h * h / 2;
  c[0] = start.convert_to<Real>();

  for (const sample& f : at) {
    const exact x = h * f.place;
    const exact p = ((c[3] * x + c[2]) * x + c[1]) * x + c[0];
    const auto error = exact(abs(p / f.value - 1)).convert_to<double>();
    result.largest_error = error > result.largest_error ? error : result.largest_error;
  }
  return result;
}

template cubic<float> fit<float>(const segment& s);
template cubic<double> fit<double>(const segment& s);

}  // namespace erfinv
