// SPDX-License-Identifier: Apache-2.0
// The inverse error function, as normal variates by inversion take it: from a table of cubics
// (statistics/common/erfinv_tables.hpp). The same bits on every SIMD target.
#pragma once

#include <cstddef>

namespace tarn::statistics {

// out[i] = erfinv(x[i]) for n numbers of [-1, 1]; the ends give the value of their neighbours of
// the type, 3.83 and 5.86. In place if out is x.
void erfinv(const float* x, std::size_t n, float* out);
void erfinv(const double* x, std::size_t n, double* out);

}  // namespace tarn::statistics
