// SPDX-License-Identifier: Apache-2.0
// Kernels of the normal family.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/normal_forms_simd.cpp"
#include <cstddef>

#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/normal_forms.hpp"
#include "simd/forms-inl.hpp"
#include "simd/inline_math-inl.hpp"
#include "simd/map-inl.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

template <class Real>
void end_all(const Real* z, std::size_t n, const normal_end<Real>& end, bool streaming, Real* out) {
  const hn::ScalableTag<Real> d;
  const placing<decltype(d)> place(d, end.outer);
  if (!end.exponential) {
    map_all(d, z, n, streaming, out, [&](auto v) { return place(v); });
    return;
  }
  const auto scale = hn::Set(d, end.inner.scale);
  const auto offset = hn::Set(d, end.inner.offset);
  map_all(d, z, n, streaming, out,
          [&](auto v) { return place(inline_exp(d, hn::Add(hn::Mul(v, scale), offset))); });
}

// Pairs, taken apart: the radii of the first numbers, and the second ones as they are.
template <class Real>
struct polar_block {
  HWY_ALIGN Real radius[box_muller_block + HWY_MAX_BYTES / sizeof(Real)];
  HWY_ALIGN Real u1[box_muller_block + HWY_MAX_BYTES / sizeof(Real)];
};

template <class D>
HWY_INLINE void to_polar(D d, const hn::TFromD<D>* u, std::size_t pairs,
                         polar_block<hn::TFromD<D>>& to) {
  auto* u1_to = to.u1;
  map_pairs<1>(d, u, pairs, to.radius, [&](auto u0, auto u1, auto* radius) {
    hn::StoreU(hn::Sqrt(hn::Mul(hn::Set(d, -2), guarded_log(d, u0))), d, radius);
    hn::StoreU(u1, d, u1_to);
    u1_to += hn::Lanes(d);
  });
}

template <class D>
HWY_INLINE sine_and_cosine<D> turned(D d, hn::Vec<D> u1) {
  constexpr auto two_pi = static_cast<hn::TFromD<D>>(6.28318530717958647693);
  return inline_sincos(d, hn::Mul(u1, hn::Set(d, two_pi)));
}

template <class Real>
void sines(Real* u, std::size_t pairs) {
  const hn::ScalableTag<Real> d;
  polar_block<Real> polar;
  to_polar(d, u, pairs, polar);
  map_two<1>(d, polar.radius, polar.u1, pairs, u, [&](auto radius, auto u1, Real* to) {
    hn::StoreU(hn::Mul(radius, turned(d, u1).sine), d, to);
  });
}

template <class Real>
void sines_and_cosines(Real* u, std::size_t pairs) {
  const hn::ScalableTag<Real> d;
  polar_block<Real> polar;
  to_polar(d, u, pairs, polar);
  map_two<2>(d, polar.radius, polar.u1, pairs, u, [&](auto radius, auto u1, Real* to) {
    const auto at = turned(d, u1);
    hn::StoreInterleaved2(hn::Mul(radius, at.sine), hn::Mul(radius, at.cosine), d, to);
  });
}

void end_float(const float* z, std::size_t n, const normal_end<float>& end, bool streaming,
               float* out) {
  end_all(z, n, end, streaming, out);
}
void end_double(const double* z, std::size_t n, const normal_end<double>& end, bool streaming,
                double* out) {
  end_all(z, n, end, streaming, out);
}
void sines_float(float* u, std::size_t pairs) {
  sines(u, pairs);
}
void sines_double(double* u, std::size_t pairs) {
  sines(u, pairs);
}
void pairs_float(float* u, std::size_t pairs) {
  sines_and_cosines(u, pairs);
}
void pairs_double(double* u, std::size_t pairs) {
  sines_and_cosines(u, pairs);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(end_float);
HWY_EXPORT(end_double);
HWY_EXPORT(sines_float);
HWY_EXPORT(sines_double);
HWY_EXPORT(pairs_float);
HWY_EXPORT(pairs_double);

void end_normals(const float* z, std::size_t n, const normal_end<float>& end, bool streaming,
                 float* out) {
  TARN_SIMD_CALL(end_float)(z, n, end, streaming, out);
}

void end_normals(const double* z, std::size_t n, const normal_end<double>& end, bool streaming,
                 double* out) {
  TARN_SIMD_CALL(end_double)(z, n, end, streaming, out);
}

void box_muller_sines(float* u, std::size_t pairs) {
  TARN_SIMD_CALL(sines_float)(u, pairs);
}

void box_muller_sines(double* u, std::size_t pairs) {
  TARN_SIMD_CALL(sines_double)(u, pairs);
}

void box_muller_pairs(float* u, std::size_t pairs) {
  TARN_SIMD_CALL(pairs_float)(u, pairs);
}

void box_muller_pairs(double* u, std::size_t pairs) {
  TARN_SIMD_CALL(pairs_double)(u, pairs);
}

}  // namespace tarn::statistics
#endif
