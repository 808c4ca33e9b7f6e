// SPDX-License-Identifier: Apache-2.0
// Cubics for erfinv(1 - t) / (1 - t), segment by segment of t.
#pragma once

#include <array>

#include <boost/multiprecision/cpp_bin_float.hpp>

namespace erfinv {

using exact = boost::multiprecision::cpp_bin_float_50;

struct segment {
  exact middle, half_width;  // of t
  exact unit;                // the cubic is one in (t - middle) / unit
};

// The segments of the rows of erfinv_layout.hpp.
segment float_segment(int row);
segment double_segment(int row);

// erfinv(1 - t) / (1 - t) for 0 < t < 2 but 1.
exact quotient(const exact& t);

template <class Real>
struct cubic {
  std::array<Real, 4> coefficients;  // of the powers 0 to 3
  double largest_error;              // relative, but for the rounding of its evaluation
};

template <class Real>
cubic<Real> fit(const segment& s);

}  // namespace erfinv
