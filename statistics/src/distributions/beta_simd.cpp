// SPDX-License-Identifier: Apache-2.0
// Kernels of the beta methods.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/beta_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/beta.hpp"
#include "distributions/candidates-inl.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// ---- Cheng ----------------------------------------------------------------------------------

// The logistic number of a uniform inside (0, 1).
HWY_INLINE reals log_odds(reals u) {
  return vector_log(hn::Div(u, hn::Sub(constant(1), u)));
}

// ln(4 u (1 - u) w), which the logarithm of what is left of the ratio of the densities must reach.
HWY_INLINE reals decision(reals u, reals w) {
  const auto both_sides = hn::Mul(hn::Mul(constant(4), u), hn::Sub(constant(1), u));
  return vector_log(hn::Mul(both_sides, w));
}

void attempt_cheng_wide(const cheng_bb& m, candidates& block, std::size_t n) {
  const real_tag d;
  const auto ratio = constant(m.ratio);
  for_candidates(block, n, [&](std::size_t i) HWY_ATTR {
    const auto u = inner(hn::Load(d, block.uniform[0] + i));
    const auto v = hn::Mul(constant(m.lambda), log_odds(u));
    const auto power = vector_exp(v);
    const auto inverse = hn::Div(constant(1), hn::Add(power, ratio));
    // The logarithm of 1 + (a / s)(e^V - 1), with what the sum has lost by rounding.
    const auto growth = hn::Mul(constant(m.part), hn::Sub(power, constant(1)));
    const auto sum = hn::Add(constant(1), growth);
    const auto lost = hn::Sub(growth, hn::Sub(sum, constant(1)));
    const auto log_sum = hn::Add(vector_log(sum), hn::Div(lost, sum));
    const auto bound = hn::Sub(hn::Mul(constant(m.a), v), hn::Mul(constant(m.sum), log_sum));
    const auto w = hn::Load(d, block.uniform[1] + i);
    const auto share = hn::Mul(m.first_is_a ? power : ratio, inverse);
    return or_rejected(hn::Ge(bound, decision(u, w)), share);
  });
}

void attempt_cheng_narrow(const cheng_bb& m, candidates& block, std::size_t n) {
  const real_tag d;
  const auto ratio = constant(m.ratio);
  for_candidates(block, n, [&](std::size_t i) HWY_ATTR {
    const auto u = inner(hn::Load(d, block.uniform[0] + i));
    const auto odds = log_odds(u);
    auto series = constant(m.series[4]);
    for (int j = 3; j >= 0; --j)
      series = hn::Add(hn::Mul(series, odds), constant(m.series[j]));
    const auto bound = hn::Neg(hn::Mul(hn::Mul(odds, odds), series));
    const auto power = vector_exp(hn::Mul(constant(m.lambda), odds));
    const auto share = hn::Div(m.first_is_a ? power : ratio, hn::Add(power, ratio));
    const auto w = hn::Load(d, block.uniform[1] + i);
    return or_rejected(hn::Ge(bound, decision(u, w)), share);
  });
}

// ---- Johnk ----------------------------------------------------------------------------------

void attempt_johnk(const johnk& m, candidates& block, std::size_t n) {
  const real_tag d;
  const auto greater = constant(m.greater);
  for_candidates(block, n, [&](std::size_t i) HWY_ATTR {
    // Logarithms of the powers, times the greater shape: one of the two is always finite.
    const auto u = inner(hn::Load(d, block.uniform[0] + i));
    const auto w = inner(hn::Load(d, block.uniform[1] + i));
    const auto log_x = hn::Div(vector_log(u), constant(m.first));
    const auto log_y = hn::Div(vector_log(w), constant(m.second));
    const auto x = vector_exp(hn::Div(log_x, greater));
    const auto y = vector_exp(hn::Div(log_y, greater));
    // x / (x + y), of which both may be 0.
    const auto odds_against = vector_exp(hn::Div(hn::Sub(log_y, log_x), greater));
    const auto value = hn::Div(constant(1), hn::Add(constant(1), odds_against));
    return or_rejected(hn::Le(hn::Add(x, y), constant(1)), value);
  });
}

// ---- Atkinson -------------------------------------------------------------------------------

void attempt_atkinson(const atkinson& m, candidates& block, std::size_t n) {
  const real_tag d;
  for_candidates(block, n, [&](std::size_t i) HWY_ATTR {
    const auto u = inner(hn::Load(d, block.uniform[0] + i));
    const auto log_w = vector_log(inner(hn::Load(d, block.uniform[1] + i)));
    const auto left = hn::Le(u, constant(m.left));
    const auto pick = [&](double at_left, double at_right) HWY_ATTR {
      return hn::IfThenElse(left, constant(at_left), constant(at_right));
    };
    // y is x on the left of t and 1 - x on the right, z the other one.
    const auto part =
        hn::Div(hn::IfThenElse(left, u, hn::Sub(constant(1), u)), pick(m.left, m.right));
    const auto log_y =
        hn::Add(hn::Div(vector_log(part), pick(m.p, m.q)), pick(m.log_t, m.log_rest));
    const auto y = vector_exp(log_y);
    const auto z = hn::Neg(vector_expm1(log_y, y));
    // z near 1 has lost what tells it from 1, y has not.
    const auto small = hn::Lt(y, constant(0.5));
    const auto log_z = hn::IfThenElse(small, vector_log1p(hn::Neg(y)), vector_log(z));
    const auto over = hn::Sub(log_z, pick(m.left_bound, m.log_t));
    const auto excess = hn::Add(log_w, hn::Mul(pick(1 - m.q, 1 - m.p), over));
    const auto is_y = m.mirrored ? hn::Not(left) : left;
    return or_rejected(hn::Le(excess, hn::Zero(d)), hn::IfThenElse(is_y, y, z));
  });
}

// ---- Inversion ------------------------------------------------------------------------------

void invert(double shape, bool complement, std::size_t n, double* x) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const real_tag d;
  for (std::size_t i = 0; i < n; i += hn::Lanes(d)) {
    const auto log = hn::Div(vector_log(hn::Load(d, x + i)), constant(shape));
    const auto power = vector_exp(log);
    hn::Store(complement ? hn::Neg(vector_expm1(log, power)) : power, d, x + i);
  }
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(attempt_cheng_wide);
HWY_EXPORT(attempt_cheng_narrow);
HWY_EXPORT(attempt_johnk);
HWY_EXPORT(attempt_atkinson);
HWY_EXPORT(invert);

void cheng_bb::attempt(candidates& block, std::size_t n) const {
  if (narrow)
    TARN_SIMD_CALL(attempt_cheng_narrow)(*this, block, n);
  else
    TARN_SIMD_CALL(attempt_cheng_wide)(*this, block, n);
}

void johnk::attempt(candidates& block, std::size_t n) const {
  TARN_SIMD_CALL(attempt_johnk)(*this, block, n);
}

void atkinson::attempt(candidates& block, std::size_t n) const {
  TARN_SIMD_CALL(attempt_atkinson)(*this, block, n);
}

void invert_beta(double shape, bool complement, std::size_t n, double* x) {
  TARN_SIMD_CALL(invert)(shape, complement, n, x);
}

}  // namespace tarn::statistics
#endif
