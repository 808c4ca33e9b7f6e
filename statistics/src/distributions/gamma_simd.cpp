// SPDX-License-Identifier: Apache-2.0
// Kernels of the gamma methods.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/gamma_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/candidates-inl.hpp"
#include "distributions/gamma.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// ---- Marsaglia and Tsang --------------------------------------------------------------------

// The logarithm below which ln u is accepted: x^2 / 2 + d (1 - v + ln v), v = (1 + e)^3, e = c x.
HWY_INLINE reals wide_bound(const marsaglia_tsang& m, reals x, reals v) {
  const auto half_square = hn::Mul(hn::Mul(x, x), constant(0.5));
  const auto tail = hn::Add(hn::Sub(constant(1), v), vector_log(v));
  return hn::Add(half_square, hn::Mul(constant(m.d), tail));
}

// The same where its terms nearly cancel. 1 - v = -3 e - 3 e^2 - e^3, ln v = 3 ln(1 + e) and
// x^2 / 2 = 9 d e^2 / 2 leave 3 d (ln(1 + e) - e + e^2 / 2 - e^3 / 3): from the fourth power on, a
// multiple of 3 d c^4 = c^2 / 3.
HWY_INLINE reals narrow_bound(const marsaglia_tsang& m, reals x, reals e) {
  auto series = hn::Mul(e, constant(1.0 / 7));
  series = hn::Mul(e, hn::Sub(constant(1.0 / 6), series));
  series = hn::Mul(e, hn::Sub(constant(1.0 / 5), series));
  series = hn::Sub(series, constant(1.0 / 4));
  const auto square = hn::Mul(x, x);
  return hn::Mul(hn::Mul(constant(m.c * m.c / 3), hn::Mul(square, square)), series);
}

// sin(pi h), |h| <= 1/2, by its power series: the next term is below 2^-59. Not to be had from the
// vector functions, which would reduce an argument that needs none.
HWY_INLINE reals sine_of_half_turn(reals h) {
  constexpr double reciprocal_of_factorial_from_19[] = {1 / 121645100408832000.0,
                                                        1 / 355687428096000.0,
                                                        1 / 1307674368000.0,
                                                        1 / 6227020800.0,
                                                        1 / 39916800.0,
                                                        1 / 362880.0,
                                                        1 / 5040.0,
                                                        1 / 120.0,
                                                        1 / 6.0};
  const auto y = hn::Mul(h, constant(3.141592653589793));
  const auto square = hn::Mul(y, y);
  auto series = constant(1 / 51090942171709440000.0);  // 21!
  for (const double coefficient : reciprocal_of_factorial_from_19)
    series = hn::Sub(constant(coefficient), hn::Mul(series, square));
  return hn::Sub(y, hn::Mul(hn::Mul(series, square), y));
}

void attempt_marsaglia_tsang(const marsaglia_tsang& m, candidates& block, std::size_t n) {
  const real_tag d;
  double* const normal = block.uniform[0];  // takes the place of the radius
  open_list open;
  for_candidates(block, n, [&](std::size_t i) HWY_ATTR {
    const auto log_radius = vector_log(inner(hn::Load(d, block.uniform[0] + i)));
    const auto radius = hn::Sqrt(hn::Mul(constant(-2), log_radius));
    const auto h = hn::Sub(constant(0.5), hn::Load(d, block.uniform[1] + i));
    const auto x = hn::Mul(radius, sine_of_half_turn(h));
    hn::Store(x, d, normal + i);

    const auto u = hn::Load(d, block.uniform[2] + i);
    const auto root = hn::Add(constant(1), hn::Mul(constant(m.c), x));
    const auto v = hn::Mul(hn::Mul(root, root), root);
    const auto possible = hn::Gt(root, hn::Zero(d));
    const auto square = hn::Mul(x, x);
    const auto surely = hn::Sub(constant(1), hn::Mul(constant(m.squeeze), hn::Mul(square, square)));
    open.add(i, hn::And(possible, hn::Not(hn::Lt(u, surely))));
    return or_rejected(possible, hn::Mul(constant(m.d), v));
  });
  open.settle(block, [&](const auto& gather) HWY_ATTR {
    const auto x = gather(normal);
    const auto e = hn::Mul(constant(m.c), x);
    const auto root = hn::Add(constant(1), e);
    const auto v = hn::Mul(hn::Mul(root, root), root);
    const auto bound = m.narrow ? narrow_bound(m, x, e) : wide_bound(m, x, v);
    return hn::Lt(vector_log(gather(block.uniform[2])), bound);
  });
}

// ---- Shapes below 1 -------------------------------------------------------------------------

void attempt_weibull(const weibull_rejection& m, candidates& block, std::size_t n) {
  const real_tag d;
  for_candidates(block, n, [&](std::size_t i) HWY_ATTR {
    const auto first = hn::Neg(vector_log(inner(hn::Load(d, block.uniform[0] + i))));
    const auto second = hn::Neg(vector_log(inner(hn::Load(d, block.uniform[1] + i))));
    const auto x = vector_exp(hn::Div(vector_log(first), constant(m.shape)));
    const auto bound = hn::Add(x, constant(m.excess));
    return or_rejected(hn::Ge(hn::Add(first, second), bound), x);
  });
}

void attempt_power(const power_rejection& m, candidates& block, std::size_t n) {
  const real_tag d;
  const auto shape = constant(m.shape);
  const auto split = constant(1 - m.shape);
  for_candidates(block, n, [&](std::size_t i) HWY_ATTR {
    const auto u = inner(hn::Load(d, block.uniform[0] + i));
    const auto decision = hn::Neg(vector_log(inner(hn::Load(d, block.uniform[1] + i))));
    const auto below = hn::Le(u, split);
    const auto rest = hn::Div(hn::Sub(constant(1), u), shape);
    const auto log = vector_log(hn::IfThenElse(below, u, rest));
    // Beyond the split, x^shape = 1 - shape + shape y with the exponential number y.
    const auto y = hn::Neg(log);
    const auto beyond = vector_log1p(hn::Mul(shape, hn::Sub(y, constant(1))));
    const auto x = vector_exp(hn::Div(hn::IfThenElse(below, log, beyond), shape));
    const auto bound = hn::Add(decision, hn::IfThenZeroElse(below, y));
    return or_rejected(hn::Le(x, bound), x);
  });
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(attempt_marsaglia_tsang);
HWY_EXPORT(attempt_weibull);
HWY_EXPORT(attempt_power);

void marsaglia_tsang::attempt(candidates& block, std::size_t n) const {
  TARN_SIMD_CALL(attempt_marsaglia_tsang)(*this, block, n);
}

void weibull_rejection::attempt(candidates& block, std::size_t n) const {
  TARN_SIMD_CALL(attempt_weibull)(*this, block, n);
}

void power_rejection::attempt(candidates& block, std::size_t n) const {
  TARN_SIMD_CALL(attempt_power)(*this, block, n);
}

}  // namespace tarn::statistics
#endif
