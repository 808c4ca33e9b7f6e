// SPDX-License-Identifier: Apache-2.0
// log(1 + x) and exp(x) - 1 without the cancellation near 0, the same bits on every SIMD target.
// The rounding of 1 + x, or of exp(x), is undone by the ratio of the exact to the rounded argument
// of the logarithm (Higham: Accuracy and Stability of Numerical Algorithms, 2nd ed., 2002, section
// 1.14.1, after Kahan). For sources that are compiled once per target: include after
// <hwy/highway.h>, inside no namespace.
#include "simd/vector_math-inl.hpp"

#if defined(TARN_NEAR_ONE_INL_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_NEAR_ONE_INL_HPP
#undef TARN_NEAR_ONE_INL_HPP
#else
#define TARN_NEAR_ONE_INL_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

// log(1 + x), x >= -1, within 6 units in the last place: 3.5 of the logarithm, 2 of three
// roundings.
HWY_INLINE double_vector vector_log1p(double_vector x) {
  namespace hn = hwy::HWY_NAMESPACE;
  const hn::ScalableTag<double> d;
  const auto one = hn::Set(d, 1.0);
  const auto sum = hn::Add(one, x);
  const auto log = hn::Mul(vector_log(sum), hn::Div(x, hn::Sub(sum, one)));
  return hn::IfThenElse(hn::Eq(sum, one), x, log);
}

// exp(x) - 1 of x <= 0, given exp(x) rounded as `power`; within 7 units in the last place. Far from
// 0 the difference has no cancellation, and the ratio would have a logarithm of 0.
HWY_INLINE double_vector vector_expm1(double_vector x, double_vector power) {
  namespace hn = hwy::HWY_NAMESPACE;
  const hn::ScalableTag<double> d;
  const auto one = hn::Set(d, 1.0);
  const auto difference = hn::Sub(power, one);
  const auto mended = hn::Mul(difference, hn::Div(x, vector_log(power)));
  const auto near = hn::IfThenElse(hn::Eq(power, one), x, mended);
  return hn::IfThenElse(hn::Gt(x, hn::Set(d, -1.0)), near, difference);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif  // per target
