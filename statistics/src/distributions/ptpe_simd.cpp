// SPDX-License-Identifier: Apache-2.0
// Candidates of PTPE.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/ptpe_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/hat-inl.hpp"
#include "distributions/ptpe.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

class ptpe_shape {
 public:
  HWY_INLINE explicit ptpe_shape(const ptpe& setup) : s_(setup) {}

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
    const auto from_top = hn::Mul(hn::Abs(hn::Sub(every(s_.xm), t)), every(1 / s_.p1));
    const auto height = hn::Add(hn::Mul(v, every(s_.c)), hn::Sub(every(1), from_top));

    const auto depth = bounded_below(v);
    const auto log_v = vector_log(depth);
    const auto y_left = hn::Add(every(s_.xl), hn::Mul(log_v, every(1 / s_.lambda_l)));
    const auto y_right = hn::Sub(every(s_.xr), hn::Mul(log_v, every(1 / s_.lambda_r)));
    const auto w_left = hn::Mul(depth, hn::Mul(hn::Sub(x, every(s_.p2)), every(s_.lambda_l)));
    const auto w_right = hn::Mul(depth, hn::Mul(hn::Sub(x, every(s_.p3)), every(s_.lambda_r)));

    proposal p;
    p.y = hn::Floor(hn::IfThenElse(middle, t, hn::IfThenElse(left, y_left, y_right)));
    p.w = hn::IfThenElse(middle, height, hn::IfThenElse(left, w_left, w_right));
    p.possible = hn::And(hn::Ge(p.y, hn::Zero(doubles())), hn::Le(p.w, every(1)));
    p.certain = hn::FirstN(doubles(), 0);
    return p;
  }

  // None: the ratio itself costs little more than bounds of its logarithm, and few need it.
  HWY_INLINE verdict squeeze(double_vector, double_vector) const {
    return {hn::FirstN(doubles(), 0), hn::FirstN(doubles(), 0)};
  }

 private:
  const ptpe& s_;
};

std::size_t attempt_ptpe(const ptpe& setup, const double* uniforms, std::size_t count,
                         std::int32_t* out) {
  return accept<ptpe_shape>(setup, uniforms, count, out);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(attempt_ptpe);

std::size_t ptpe::attempt(const double* uniforms, std::size_t count, std::int32_t* out) const {
  return TARN_SIMD_CALL(attempt_ptpe)(*this, uniforms, count, out);
}

}  // namespace tarn::statistics
#endif
