// SPDX-License-Identifier: Apache-2.0
// Gamma variates for the routines that are built on them.
#pragma once

#include <cstddef>

#include "distributions/exponential.hpp"
#include "distributions/gamma.hpp"
#include "routines/routine.hpp"

namespace tarn::statistics {

// where.place + where.scale * x, x of the gamma law of that shape. Words: one a value for the shape
// 1, else the width of the method for each candidate. `accurate` matters to the shape 1 only: by
// rejection nothing falls below where.place.
template <class Real>
int draw_gamma(const live_stream& s, int n, Real* r, Real shape, const affine_place<Real>& where,
               bool accurate) {
  const auto by = [&](const auto& method) {
    draw_by_rejection(source_of(s), static_cast<std::size_t>(n), method, where, r);
    return RVX_STATUS_OK;
  };
  if (shape > 1)
    return by(marsaglia_tsang(shape));
  if (shape == 1)
    return draw_from(s, n, 1, r, exponential<Real>{where.place, where.scale, accurate});
  return shape > last_power_shape ? by(weibull_rejection(shape)) : by(power_rejection(shape));
}

}  // namespace tarn::statistics
