// SPDX-License-Identifier: Apache-2.0
// Candidates of the negative binomial law for shapes of at least 1.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/negative_binomial_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/hat-inl.hpp"
#include "distributions/negative_binomial.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

class nbar_shape {
 public:
  HWY_INLINE explicit nbar_shape(const nbar& setup) : s_(setup) {}

  // Below the chords.
  HWY_INLINE truths settles(double_vector u, double_vector v, double_vector& y) const {
    const auto x = hn::Mul(u, every(s_.total));
    y = hn::Floor(hn::Add(every(s_.begin), x));
    const auto k = hn::Sub(y, every(s_.near.center));
    const truths right = hn::Ge(k, hn::Zero(doubles()));
    const auto chord = hn::IfThenElse(right, every(-s_.right.chord), every(s_.left.chord));
    const truths below = hn::Le(v, hn::Add(every(1), hn::Mul(k, chord)));
    return hn::And(hn::Lt(x, every(s_.middle)), below);
  }

  HWY_INLINE proposal propose(double_vector u, double_vector v) const {
    const auto x = hn::Mul(u, every(s_.total));
    const auto depth = bounded_below(v);
    proposal p;
    p.y = hn::Add(every(s_.begin), x);
    p.w = depth;
    p.certain = hn::FirstN(doubles(), 0);
    const truths tails = hn::Gt(x, every(s_.left.slope_end));
    if (!hn::AllFalse(doubles(), tails)) {
      const auto log_v = vector_log(depth);
      tail(s_.right, 1, s_.left.slope_end, x, depth, log_v, p);
      tail(s_.left, -1, s_.right.tail_end, x, depth, log_v, p);
    }
    slope(s_.left, -1, s_.right.slope_end, x, depth, p);
    slope(s_.right, 1, s_.middle, x, depth, p);
    const truths middle = hn::Lt(x, every(s_.middle));
    p.y = hn::Floor(hn::IfThenElse(middle, hn::Add(every(s_.begin), x), p.y));
    p.w = hn::IfThenElse(middle, depth, p.w);
    p.possible = hn::Ge(p.y, hn::Zero(doubles()));
    const auto above_right = hn::Sub(p.y, every(s_.right.knee));
    const auto above_left = hn::Sub(every(s_.left.knee), p.y);
    p.certain = hn::And(hn::Not(middle), hn::Or(below_tangent(s_.right, above_right, p.w),
                                                below_tangent(s_.left, above_left, p.w)));
    return p;
  }

  HWY_INLINE verdict squeeze(double_vector, double_vector) const {
    return {hn::FirstN(doubles(), 0), hn::FirstN(doubles(), 0)};
  }

 private:
  // Candidates of a trapezoid, whose area begins at `from`: the distance from the foot is evenly
  // distributed in squares.
  HWY_INLINE void slope(const nbar::side& side, double outwards, double from, double_vector x,
                        double_vector v, proposal& p) const {
    const double least = side.excess * side.excess;
    const double scale = (1 + 2 * side.excess) / side.slope_area;
    const auto part = hn::Mul(hn::Sub(x, every(from)), every(scale));
    const auto height = hn::Sqrt(hn::Add(part, every(least)));
    const auto inwards = hn::Mul(hn::Sub(height, every(side.excess)), every(side.width));
    const truths here = hn::Le(x, every(side.slope_end));
    p.y = hn::IfThenElse(here, hn::Sub(every(side.foot), hn::Mul(every(outwards), inwards)), p.y);
    p.w = hn::IfThenElse(here, hn::Mul(hn::Mul(v, every(side.ratio)), height), p.w);
  }

  // Candidates of a tail, whose area begins at `from`.
  HWY_INLINE void tail(const nbar::side& side, double outwards, double from, double_vector x,
                       double_vector v, double_vector log_v, proposal& p) const {
    const auto distance = hn::Mul(log_v, every(outwards / side.decay));
    const auto height = hn::Mul(hn::Sub(every(from), x), every(side.decay));
    const truths here = hn::Gt(x, every(from));
    p.y = hn::IfThenElse(here, hn::Add(every(side.foot), distance), p.y);
    p.w = hn::IfThenElse(here, hn::Mul(v, height), p.w);
  }

  HWY_INLINE truths below_tangent(const nbar::side& side, double_vector steps,
                                  double_vector w) const {
    const auto tangent = hn::Sub(every(side.ratio), hn::Mul(steps, every(side.tangent)));
    return hn::And(hn::Ge(steps, hn::Zero(doubles())), hn::Le(w, tangent));
  }

  const nbar& s_;
};

std::size_t attempt_nbar(const nbar& setup, const double* uniforms, std::size_t count,
                         std::int32_t* out) {
  return accept<nbar_shape>(setup, uniforms, count, out);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(attempt_nbar);

std::size_t nbar::attempt(const double* uniforms, std::size_t count, std::int32_t* out) const {
  return TARN_SIMD_CALL(attempt_nbar)(*this, uniforms, count, out);
}

}  // namespace tarn::statistics
#endif
