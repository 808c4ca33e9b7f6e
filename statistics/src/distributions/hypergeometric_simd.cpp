// SPDX-License-Identifier: Apache-2.0
// Candidates of H2PE.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/hypergeometric_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/hat-inl.hpp"
#include "distributions/hypergeometric.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

// x (1 + x (-1/2 + x / 3)): the logarithm of 1 + x up to a fourth power.
HWY_INLINE double_vector log_start(double_vector x) {
  const auto inner = hn::Add(every(-0.5), hn::Mul(x, every(1.0 / 3)));
  return hn::Mul(x, hn::Add(every(1), hn::Mul(x, inner)));
}

// A bound of that fourth power: x^4, divided by 1 + x for negative x; a quarter of it is the bound.
HWY_INLINE double_vector log_rest(double_vector x) {
  const auto square = hn::Mul(x, x);
  const auto negative = hn::Lt(x, hn::Zero(doubles()));
  const auto divisor = hn::IfThenElse(negative, hn::Add(every(1), x), every(1));
  return hn::Div(hn::Mul(square, square), divisor);
}

class h2pe_shape {
 public:
  HWY_INLINE explicit h2pe_shape(const h2pe& setup) : s_(setup) {}

  HWY_INLINE truths settles(double_vector, double_vector, double_vector&) const {
    return hn::FirstN(doubles(), 0);
  }

  HWY_INLINE proposal propose(double_vector u, double_vector v) const {
    const auto x = hn::Mul(u, every(s_.p3));
    const truths middle = hn::Le(x, every(s_.p1));
    const truths left = hn::Le(x, every(s_.p2));

    const auto depth = bounded_below(v);
    const auto log_v = vector_log(depth);
    const auto y_middle = hn::Add(every(s_.xl), x);
    const auto y_left = hn::Add(every(s_.xl), hn::Mul(log_v, every(1 / s_.lambda_l)));
    const auto y_right = hn::Sub(every(s_.xr), hn::Mul(log_v, every(1 / s_.lambda_r)));
    const auto w_left = hn::Mul(depth, hn::Mul(hn::Sub(x, every(s_.p1)), every(s_.lambda_l)));
    const auto w_right = hn::Mul(depth, hn::Mul(hn::Sub(x, every(s_.p2)), every(s_.lambda_r)));

    proposal p;
    p.y = hn::Floor(hn::IfThenElse(middle, y_middle, hn::IfThenElse(left, y_left, y_right)));
    p.w = hn::IfThenElse(middle, depth, hn::IfThenElse(left, w_left, w_right));
    p.possible = hn::And(hn::Ge(p.y, hn::Zero(doubles())), hn::Le(p.y, every(s_.greatest)));
    p.certain = hn::FirstN(doubles(), 0);
    return p;
  }

  // Bounds of the logarithm of the ratio for a mode of at least 100 and values above 50.
  HWY_INLINE verdict squeeze(double_vector y, double_vector w) const {
    const double m = s_.near.center;
    const truths valid = hn::And(hn::Gt(y, every(50)), hn::Ge(every(m), every(100)));
    const auto one = every(1);
    const auto zero = hn::Zero(doubles());
    const auto y1 = hn::Add(y, one);
    const auto ym = hn::Sub(y, every(m));
    const auto minus_ym = hn::Sub(every(m), y);
    const auto yn = hn::Add(hn::Sub(every(s_.n1), y), one);
    const auto yk = hn::Add(hn::Sub(every(s_.k), y), one);
    const auto nk = hn::Add(every(s_.n2_k), y1);
    const auto r = hn::Div(minus_ym, y1), s = hn::Div(ym, yn);
    const auto t = hn::Div(ym, yk), e = hn::Div(minus_ym, nk);
    const auto xm = every(m + 0.5), xn = every(s_.n1 - m + 0.5);
    const auto xk = every(s_.k - m + 0.5), nm = every(s_.n2_k + m + 0.5);

    const auto g = hn::Sub(hn::Div(hn::Mul(yn, yk), hn::Mul(y1, nk)), one);
    const auto gu = log_start(g);
    const auto gl = hn::Sub(gu, hn::Mul(every(0.25), log_rest(g)));
    auto upper = hn::Add(hn::Sub(hn::Mul(y, gu), hn::Mul(every(m), gl)), every(0.0034));
    auto rest = zero;
    const auto add = [&](double_vector weight, double_vector x) {
      upper = hn::Add(upper, hn::Mul(weight, log_start(x)));
      rest = hn::Add(rest, hn::Mul(weight, log_rest(x)));
    };
    add(xm, r);
    add(xn, s);
    add(xk, t);
    add(nm, e);
    const auto gap = hn::Mul(hn::Add(y, every(m)), hn::Sub(gl, gu));
    const auto lower =
        hn::Sub(hn::Add(hn::Sub(upper, hn::Mul(every(0.25), rest)), gap), every(0.0078));
    const auto log_w = vector_log(w);
    return {hn::And(valid, hn::Lt(log_w, lower)), hn::And(valid, hn::Gt(log_w, upper))};
  }

 private:
  const h2pe& s_;
};

std::size_t attempt_h2pe(const h2pe& setup, const double* uniforms, std::size_t count,
                         std::int32_t* out) {
  return accept<h2pe_shape>(setup, uniforms, count, out);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(attempt_h2pe);

std::size_t h2pe::attempt(const double* uniforms, std::size_t count, std::int32_t* out) const {
  return TARN_SIMD_CALL(attempt_h2pe)(*this, uniforms, count, out);
}

}  // namespace tarn::statistics
#endif
