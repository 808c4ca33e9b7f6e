// SPDX-License-Identifier: Apache-2.0
// Standard normal variates for distributions that are built on them: by inversion, one word each.
#pragma once

#include <cstddef>

#include "blocks.hpp"
#include "distributions/canonical.hpp"
#include "distributions/erfinv.hpp"
#include "distributions/normal_forms.hpp"

namespace tarn::statistics {

// The next n standard normals of the source, sqrt(2) erfinv(u) with u uniform on [-1, 1).
template <class Real>
void draw_standard_normals(const word_source& source, std::size_t n, Real* out) {
  canonical<Real>(source, -1, 1).draw(source, n, out);
  erfinv(out, n, out);
  end_normals(out, n, end_of_erfinv(gaussian_end<Real>(0, 1)), false, out);
}

}  // namespace tarn::statistics
