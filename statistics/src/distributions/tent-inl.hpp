// SPDX-License-Identifier: Apache-2.0
// Candidates under a tent. For sources that are compiled once per target: include after
// <hwy/highway.h>, inside no namespace.
#include "distributions/hat-inl.hpp"
#include "distributions/tent.hpp"

#if defined(TARN_TENT_INL_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_TENT_INL_HPP
#undef TARN_TENT_INL_HPP
#else
#define TARN_TENT_INL_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

// For laws on 0 to `greatest`; accept() says what settles and propose are.
class tent_shape {
 public:
  HWY_INLINE tent_shape(const tent& hat, double greatest) : s_(hat), greatest_(greatest) {}

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
    const truths inside = hn::And(hn::Ge(p.y, hn::Zero(doubles())), hn::Le(p.y, every(greatest_)));
    p.possible = hn::And(inside, hn::Le(p.w, every(1)));
    p.certain = hn::FirstN(doubles(), 0);
    return p;
  }

 private:
  const tent& s_;
  double greatest_;
};

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif  // per target
