// SPDX-License-Identifier: Apache-2.0
// Ratios of probabilities on whole vectors, the same bits on every SIMD target. For sources that
// are compiled once per target: include after <hwy/highway.h>, inside no namespace.
#include "distributions/log_ratio.hpp"
#include "simd/vector_math-inl.hpp"

#if defined(TARN_LOG_RATIO_INL_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_LOG_RATIO_INL_HPP
#undef TARN_LOG_RATIO_INL_HPP
#else
#define TARN_LOG_RATIO_INL_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

using doubles = hn::ScalableTag<double>;
using truths = hn::Mask<doubles>;

HWY_INLINE double_vector every(double x) {
  return hn::Set(doubles(), x);
}

// c[0] + x (c[1] + x (c[2] + ...)).
template <std::size_t N>
HWY_INLINE double_vector polynomial(double_vector x, const double (&c)[N]) {
  double_vector sum = every(c[N - 1]);
  for (std::size_t i = N - 1; i-- > 0;)
    sum = hn::Add(hn::Mul(sum, x), every(c[i]));
  return sum;
}

// ln x! - x ln x + x for x >= 16: ln(2 pi x) / 2 and Stirling's series, cut where the next term is
// below 691 / (360360 * 16^11) = 1.1e-16.
HWY_INLINE double_vector large_remainder(double_vector x) {
  constexpr double series[] = {1.0 / 12, -1.0 / 360, 1.0 / 1260, -1.0 / 1680, 1.0 / 1188};
  const auto inverse = hn::Div(every(1), x);
  const auto correction = hn::Mul(inverse, polynomial(hn::Mul(inverse, inverse), series));
  constexpr double two_pi = 6.283185307179586477;
  return hn::Add(hn::Mul(every(0.5), vector_log_close(hn::Mul(every(two_pi), x))), correction);
}

// x ln(x / y), 0 at x = 0.
HWY_INLINE double_vector x_log(double_vector x, double_vector y) {
  // Any positive number will do in the logarithm of a term that is multiplied by 0.
  const auto safe = hn::IfThenElse(hn::Gt(x, hn::Zero(doubles())), x, y);
  return hn::Mul(x, vector_log_close(hn::Div(safe, y)));
}

// The same for x >= 0, by x! = (x + 16)! / ((x + 1) ... (x + 16)).
HWY_INLINE double_vector factorial_remainder(double_vector x) {
  const truths small = hn::Lt(x, every(16));
  if (hn::AllFalse(doubles(), small))
    return large_remainder(x);
  const auto z = hn::IfThenElse(small, hn::Add(x, every(16)), x);
  auto product = every(1);
  for (int i = 1; i <= 16; ++i)
    product = hn::Mul(product, hn::Add(x, every(i)));
  const auto log_product = vector_log_close(hn::IfThenElse(small, product, every(1)));
  // ln z! - x ln x + x without the logarithm of the product
  const auto one = every(1);
  const auto z_log = x_log(z, one);
  const auto from_z = hn::Add(hn::Sub(z_log, z), large_remainder(z));
  const auto of_small = hn::Add(hn::Sub(hn::Sub(from_z, log_product), x_log(x, one)), x);
  return hn::IfThenElse(small, of_small, large_remainder(z));
}

// x ln(x / c) + c - x for x >= 0, c > 0, difference = x - c. Near c by the series of ln(x / c) =
// 2 artanh v with v = (x - c) / (x + c), |v| < 1/10, whose next term is below 2^-60 of the first.
HWY_INLINE double_vector deviance(double_vector x, double_vector c, double_vector difference) {
  constexpr double series[] = {1.0 / 3,  1.0 / 5,  1.0 / 7,  1.0 / 9,
                               1.0 / 11, 1.0 / 13, 1.0 / 15, 1.0 / 17};
  const auto v = hn::Div(difference, hn::Add(x, c));
  const auto v2 = hn::Mul(v, v);
  const auto cubic = hn::Mul(hn::Mul(hn::Add(x, x), hn::Mul(v, v2)), polynomial(v2, series));
  const auto near = hn::Add(hn::Mul(v, difference), cubic);
  const truths is_near = hn::Lt(hn::Abs(v), every(0.1));
  if (hn::AllTrue(doubles(), is_near))
    return near;
  return hn::IfThenElse(is_near, near, hn::Sub(x_log(x, c), difference));
}

// The deviance of y + gap from m + gap less the one of y from m = y - k, for y >= 0, m > 0: what
// the two lose against each other would be about y 2^-53. With c = m + gap and
// pull = gap k / c, the difference of the two is
//
//   gap (ln(1 + k / c) - k / c) + y (ln(1 - pull / y) + pull / y),
//
// two deviances again, both at most 0.
HWY_INLINE double_vector deviance_gap(double_vector y, double_vector k, double m, double gap) {
  const auto c = every(m + gap);
  const auto ahead = deviance(c, hn::Add(y, every(gap)), hn::Neg(k));
  const auto pull = hn::Mul(every(gap / (m + gap)), k);
  const auto behind = deviance(y, hn::Sub(y, pull), pull);
  return hn::Neg(hn::Add(hn::Mul(every(gap / (m + gap)), ahead), behind));
}

// ln of x! / x^x e^x less that of c!.
HWY_INLINE double_vector remainder_rise(const factorial_term& term, double_vector x) {
  return hn::Sub(factorial_remainder(x), every(term.remainder));
}

// exp(log ratio of y). Numbers y that have no factorial give 0.
HWY_INLINE double_vector ratio_at(const log_ratio& r, double_vector y) {
  const auto zero = hn::Zero(doubles());
  const auto k = hn::Sub(y, every(r.reference));
  auto sum = hn::Add(hn::Mul(k, every(r.slope)), every(r.shift));
  truths none = hn::Lt(zero, zero);
  for (std::size_t i = 0; i < r.terms; ++i) {
    const factorial_term& term = r.term[i];
    const auto argument = hn::Add(every(term.center), hn::Mul(every(term.direction), k));
    const truths outside = hn::Lt(argument, zero);
    none = hn::Or(none, outside);
    const auto x = hn::IfThenElse(outside, every(term.center), argument);
    auto rise = remainder_rise(term, x);
    if (r.gap == 0)
      rise = hn::Add(deviance(x, every(term.center), hn::Sub(x, every(term.center))), rise);
    sum = hn::Add(sum, hn::Mul(every(term.sign), rise));
  }
  if (r.gap != 0) {
    const auto x = hn::IfThenElse(none, every(r.reference), y);
    sum = hn::Add(sum, deviance_gap(x, hn::Sub(x, every(r.reference)), r.reference, r.gap));
  }
  return hn::IfThenElse(none, zero, vector_exp(sum));
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif  // per target
