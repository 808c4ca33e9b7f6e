// SPDX-License-Identifier: Apache-2.0
// Normal variates by each of their methods, for the routines that are built on them.
#pragma once

#include "distributions/normal.hpp"
#include "routines/routine.hpp"

namespace tarn::statistics {

// A method of parameters::gaussian_methods, or a negative status for one that does not exist.
template <class Real>
int draw_gaussian(int method, const live_stream& s, int n, Real* r, Real mean, Real stddev) {
  const normal_end<Real> end = gaussian_end(mean, stddev);
  switch (method) {
    case RVX_RNG_METHOD_GAUSSIAN_BOXMULLER:
      return draw_from(s, n, 2, r, box_muller<Real>{end});
    case RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2:
      return draw_from(s, n, 1, r, box_muller2<Real>{end});
    case RVX_RNG_METHOD_GAUSSIAN_ICDF:
      return draw_from(s, n, 1, r, normal_inversion<Real>{end});
    default:
      return -1;
  }
}

}  // namespace tarn::statistics
