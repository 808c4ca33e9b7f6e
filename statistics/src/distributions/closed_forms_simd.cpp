// SPDX-License-Identifier: Apache-2.0
// Kernels of the distributions whose inverse is a closed formula.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/closed_forms_simd.cpp"
#include <cstddef>
#include <limits>

#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/closed_forms.hpp"
#include "simd/forms-inl.hpp"
#include "simd/inline_math-inl.hpp"
#include "simd/map-inl.hpp"
#include "simd/target.hpp"
#include "simd/vector_math-inl.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

template <class Real, class Standard>
HWY_INLINE void form(const Real* u, std::size_t n, const placement<Real>& to, bool streaming,
                     Real* out, const Standard& standard) {
  const hn::ScalableTag<Real> d;
  const placing<decltype(d)> place(d, to);
  map_all(d, u, n, streaming, out, [&](auto v) { return place(standard(v)); });
}

// u becomes l = ln(u): a pass of its own, since the steps of one long pass would wait for each
// other.
template <class Real>
HWY_INLINE void to_logs(Real* u, std::size_t n) {
  const hn::ScalableTag<Real> d;
  map_all(d, u, n, false, u, [&](auto v) { return guarded_log(d, v); });
}

template <class Real>
HWY_INLINE void exponential(Real* u, std::size_t n, const placement<Real>& to, bool streaming,
                            Real* out) {
  const hn::ScalableTag<Real> d;
  form(u, n, to, streaming, out, [&](auto v) { return hn::Neg(guarded_log(d, v)); });
}

template <class Real>
HWY_INLINE void rayleigh(Real* u, std::size_t n, const placement<Real>& to, bool streaming,
                         Real* out) {
  const hn::ScalableTag<Real> d;
  form(u, n, to, streaming, out, [&](auto v) { return hn::Sqrt(hn::Neg(guarded_log(d, v))); });
}

template <class Real>
HWY_INLINE void gumbel(Real* u, std::size_t n, const placement<Real>& to, bool streaming,
                       Real* out) {
  const hn::ScalableTag<Real> d;
  to_logs(u, n);
  form(u, n, to, streaming, out, [&](auto l) { return guarded_log(d, hn::Neg(l)); });
}

template <class Real>
HWY_INLINE void cauchy(Real* u, std::size_t n, const placement<Real>& to, bool streaming,
                       Real* out) {
  form(u, n, to, streaming, out, [&](auto v) { return vector_tan(v); });
}

// A power by exponential and logarithm of base 2: its relative error is that of the exponential's
// argument, below 4 |y log x| units in the last place, which for shapes above 1/4 is a few units
// over all but the farthest tail; and it takes half the time of a power within one unit. The power
// of 0 is 0, as the logarithm of 0 is minus infinity and the exponent positive.
template <class Real>
HWY_INLINE void weibull(Real* u, std::size_t n, Real exponent, const placement<Real>& to,
                        bool streaming, Real* out) {
  const hn::ScalableTag<Real> d;
  to_logs(u, n);
  const auto factor = hn::Set(d, exponent);
  const auto log_zero = hn::Set(d, -std::numeric_limits<Real>::infinity());
  map_all(d, u, n, false, u, [&](auto l) {
    const auto log = inline_log<base::two>(d, hn::Neg(l));
    return hn::Mul(hn::IfThenElse(hn::Eq(l, hn::Zero(d)), log_zero, log), factor);
  });
  form(u, n, to, streaming, out, [&](auto v) { return inline_exp2(d, v); });
}

#define TARN_FORM(name, real)                                                           \
  void name##_##real(real* u, std::size_t n, const placement<real>& to, bool streaming, \
                     real* out) {                                                       \
    name(u, n, to, streaming, out);                                                     \
  }
TARN_FORM(exponential, float)
TARN_FORM(exponential, double)
TARN_FORM(rayleigh, float)
TARN_FORM(rayleigh, double)
TARN_FORM(gumbel, float)
TARN_FORM(gumbel, double)
TARN_FORM(cauchy, float)
TARN_FORM(cauchy, double)
#undef TARN_FORM

void weibull_float(float* u, std::size_t n, float exponent, const placement<float>& to,
                   bool streaming, float* out) {
  weibull(u, n, exponent, to, streaming, out);
}
void weibull_double(double* u, std::size_t n, double exponent, const placement<double>& to,
                    bool streaming, double* out) {
  weibull(u, n, exponent, to, streaming, out);
}

template <class Real>
HWY_INLINE void laplace(const Real* u, std::size_t n, const placement<Real>& to, Real* out) {
  const hn::ScalableTag<Real> d;
  const placing<decltype(d)> place(d, to);
  map_pairs<1>(d, u, n, out, [&](auto u0, auto u1, Real* at) {
    const auto l = guarded_log(d, u0);
    const auto upper = hn::Gt(u1, hn::Set(d, static_cast<Real>(0.5)));
    hn::StoreU(place(hn::IfThenElse(upper, l, hn::Neg(l))), d, at);
  });
}

void laplace_float(float* u, std::size_t n, const placement<float>& to, float* out) {
  laplace(u, n, to, out);
}
void laplace_double(double* u, std::size_t n, const placement<double>& to, double* out) {
  laplace(u, n, to, out);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

#define TARN_FORM(name, real)                                                                      \
  HWY_EXPORT(name##_##real);                                                                       \
  void name##_form(real* u, std::size_t n, const placement<real>& to, bool streaming, real* out) { \
    TARN_SIMD_CALL(name##_##real)(u, n, to, streaming, out);                                       \
  }
TARN_FORM(exponential, float)
TARN_FORM(exponential, double)
TARN_FORM(rayleigh, float)
TARN_FORM(rayleigh, double)
TARN_FORM(gumbel, float)
TARN_FORM(gumbel, double)
TARN_FORM(cauchy, float)
TARN_FORM(cauchy, double)
#undef TARN_FORM

HWY_EXPORT(weibull_float);
HWY_EXPORT(weibull_double);
HWY_EXPORT(laplace_float);
HWY_EXPORT(laplace_double);

void weibull_form(float* u, std::size_t n, float exponent, const placement<float>& to,
                  bool streaming, float* out) {
  TARN_SIMD_CALL(weibull_float)(u, n, exponent, to, streaming, out);
}

void weibull_form(double* u, std::size_t n, double exponent, const placement<double>& to,
                  bool streaming, double* out) {
  TARN_SIMD_CALL(weibull_double)(u, n, exponent, to, streaming, out);
}

void laplace_form(float* u, std::size_t n, const placement<float>& to, float* out) {
  TARN_SIMD_CALL(laplace_float)(u, n, to, out);
}

void laplace_form(double* u, std::size_t n, const placement<double>& to, double* out) {
  TARN_SIMD_CALL(laplace_double)(u, n, to, out);
}

}  // namespace tarn::statistics
#endif
