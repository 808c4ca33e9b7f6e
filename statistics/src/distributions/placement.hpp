// SPDX-License-Identifier: Apache-2.0
// How a standard variate z becomes a value of its distribution: scale * z + offset, each step
// rounded, and kept within [least, the greatest finite number].
#pragma once

#include <limits>

#include "distributions/real_words.hpp"

namespace tarn::statistics {

template <class Real>
struct placement {
  affine<Real> map;
  Real least;
};

template <class Real>
placement<Real> placed(Real offset, Real scale) {
  return {{scale, offset}, -std::numeric_limits<Real>::max()};
}

// For the accurate methods of distributions on [offset, infinity), which no rounding may leave.
template <class Real>
placement<Real> placed(Real offset, Real scale, bool accurate) {
  return {{scale, offset}, accurate ? offset : -std::numeric_limits<Real>::max()};
}

}  // namespace tarn::statistics
