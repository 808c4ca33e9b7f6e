// SPDX-License-Identifier: Apache-2.0
// Candidates of BTPE.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/binomial_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/binomial.hpp"
#include "distributions/hat-inl.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

class btpe_shape {
 public:
  HWY_INLINE explicit btpe_shape(const btpe& setup)
      : s_(setup), half_inverse_npq_(0.5 / s_.npq), greatest_k_(s_.npq / 2 - 1) {}

  // The triangle.
  HWY_INLINE truths settles(double_vector u, double_vector v, double_vector& y) const {
    const auto x = hn::Mul(u, every(s_.p4));
    y = hn::Floor(hn::Add(hn::Sub(every(s_.xm), hn::Mul(every(s_.p1), v)), x));
    return hn::Le(x, every(s_.p1));
  }

  HWY_INLINE proposal propose(double_vector u, double_vector v) const {
    const auto x = hn::Mul(u, every(s_.p4));
    const truths middle = hn::Le(x, every(s_.p2));
    const truths left = hn::Le(x, every(s_.p3));

    const auto t = hn::Add(every(s_.xl), hn::Mul(hn::Sub(x, every(s_.p1)), every(1 / s_.c)));
    const auto slope = hn::Mul(hn::Abs(hn::Sub(every(s_.xm), t)), every(1 / s_.p1));
    const auto height = hn::Add(hn::Mul(v, every(s_.c)), hn::Sub(every(1), slope));

    const auto depth = bounded_below(v);
    const auto log_v = vector_log(depth);
    const auto y_left = hn::Add(every(s_.xl), hn::Mul(log_v, every(1 / s_.lambda_l)));
    const auto y_right = hn::Sub(every(s_.xr), hn::Mul(log_v, every(1 / s_.lambda_r)));
    const auto w_left = hn::Mul(depth, hn::Mul(hn::Sub(x, every(s_.p2)), every(s_.lambda_l)));
    const auto w_right = hn::Mul(depth, hn::Mul(hn::Sub(x, every(s_.p3)), every(s_.lambda_r)));

    proposal p;
    p.y = hn::Floor(hn::IfThenElse(middle, t, hn::IfThenElse(left, y_left, y_right)));
    p.w = hn::IfThenElse(middle, height, hn::IfThenElse(left, w_left, w_right));
    const truths inside = hn::And(hn::Ge(p.y, hn::Zero(doubles())), hn::Le(p.y, every(s_.n)));
    p.possible = hn::And(inside, hn::Le(p.w, every(1)));
    p.certain = hn::FirstN(doubles(), 0);
    return p;
  }

  // Normal bounds of the logarithm of the ratio, for |k| < npq / 2 - 1.
  HWY_INLINE verdict squeeze(double_vector y, double_vector w) const {
    const auto k = hn::Abs(hn::Sub(y, every(s_.near.center)));
    const auto inverse = every(2 * half_inverse_npq_);
    const auto cubic = hn::Mul(
        hn::Add(hn::Mul(k, hn::Add(hn::Mul(k, every(1.0 / 3)), every(0.625))), every(1.0 / 6)),
        inverse);
    const auto rho = hn::Mul(hn::Mul(k, inverse), hn::Add(cubic, every(0.5)));
    const auto t = hn::Mul(hn::Mul(k, k), every(-half_inverse_npq_));
    const auto log_w = vector_log(w);
    const truths valid = hn::Lt(k, every(greatest_k_));
    return {hn::And(valid, hn::Lt(log_w, hn::Sub(t, rho))),
            hn::And(valid, hn::Gt(log_w, hn::Add(t, rho)))};
  }

 private:
  const btpe& s_;
  double half_inverse_npq_, greatest_k_;
};

std::size_t attempt_btpe(const btpe& setup, const double* uniforms, std::size_t count,
                         std::int32_t* out) {
  return accept<btpe_shape>(setup, uniforms, count, out);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(attempt_btpe);

std::size_t btpe::attempt(const double* uniforms, std::size_t count, std::int32_t* out) const {
  return TARN_SIMD_CALL(attempt_btpe)(*this, uniforms, count, out);
}

}  // namespace tarn::statistics
#endif
