// SPDX-License-Identifier: Apache-2.0
// Kernels of the inverse error function.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/erfinv_simd.cpp"
#include <cstddef>

#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/erfinv.hpp"
#include "simd/erfinv-inl.hpp"
#include "simd/map-inl.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

void erfinv_float(const float* x, std::size_t n, float* out) {
  const hn::ScalableTag<float> d;
  map_all(d, x, n, false, out, [](auto v) { return vector_erfinv(v); });
}

void erfinv_double(const double* x, std::size_t n, double* out) {
  const hn::ScalableTag<double> d;
  map_all(d, x, n, false, out, [](auto v) { return vector_erfinv(v); });
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(erfinv_float);
HWY_EXPORT(erfinv_double);

void erfinv(const float* x, std::size_t n, float* out) {
  TARN_SIMD_CALL(erfinv_float)(x, n, out);
}

void erfinv(const double* x, std::size_t n, double* out) {
  TARN_SIMD_CALL(erfinv_double)(x, n, out);
}

}  // namespace tarn::statistics
#endif
