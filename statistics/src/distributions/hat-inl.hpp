// SPDX-License-Identifier: Apache-2.0
// Rejection of integers from under a hat on whole vectors, in stages of which each sees only what
// the one before left undecided. For sources that are compiled once per target: include after
// <hwy/highway.h>, inside no namespace.
#include <algorithm>

#include "distributions/hat.hpp"
#include "distributions/log_ratio-inl.hpp"
#include "simd/compressed-inl.hpp"
#include "simd/target.hpp"

#if defined(TARN_HAT_INL_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_HAT_INL_HPP
#undef TARN_HAT_INL_HPP
#else
#define TARN_HAT_INL_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

// A column of candidates.
struct column {
  HWY_ALIGN double row[candidate_room];

  HWY_INLINE double_vector at(std::size_t i) const { return hn::LoadU(doubles(), row + i); }
  // Appends the lanes of the mask behind the first n.
  HWY_INLINE void append(std::size_t n, double_vector x, truths mask) {
    hn::StoreU(compressed(doubles(), x, mask), doubles(), row + n);
  }
};

struct proposal {
  double_vector y, w;
  truths possible;  // y is a value of the law
  truths certain;   // and w is known to be below its ratio
};
struct verdict {
  truths yes, no;  // neither where w is next to the ratio
};

HWY_INLINE double_vector bounded_below(double_vector v) {
  const auto least = every(least_uniform);
  return hn::IfThenElse(hn::Lt(v, least), least, v);
}

// Candidates that wait for a verdict: two numbers each and the place of the value.
struct undecided {
  column first, second, place;
  std::size_t size = 0;

  HWY_INLINE void add(double_vector a, double_vector b, double_vector at, truths mask) {
    first.append(size, a, mask);
    second.append(size, b, mask);
    place.append(size, at, mask);
    size += hn::CountTrue(doubles(), mask);
  }
  // What the last whole vector has behind the last candidate.
  HWY_INLINE void pad(double a, double b) {
    const truths all = hn::FirstN(doubles(), hn::Lanes(doubles()));
    first.append(size, every(a), all);
    second.append(size, every(b), all);
  }
};

// Values accepted late, with their places.
struct late_values {
  column value, place;
  std::size_t size = 0;

  HWY_INLINE void add(double_vector y, double_vector at, truths mask) {
    value.append(size, y, mask);
    place.append(size, at, mask);
    size += hn::CountTrue(doubles(), mask);
  }
};

// First stage: the values accepted at sight, -1 elsewhere, and the candidates that are left.
template <class Shape>
HWY_INLINE void settle(const Shape& shape, const double* uniforms, std::size_t count, column& value,
                       undecided& left) {
  const doubles d;
  const auto ascending = hn::Iota(d, 0);
  for (std::size_t i = 0; i < count; i += hn::Lanes(d)) {
    double_vector u, v, y = every(-1);
    hn::LoadInterleaved2(d, uniforms + 2 * i, u, v);
    const truths settled = shape.settles(u, v, y);
    hn::StoreU(hn::IfThenElse(settled, y, every(-1)), d, value.row + i);
    const truths open = hn::And(hn::Not(settled), hn::FirstN(d, count - i));
    left.add(u, v, hn::Add(every(static_cast<double>(i)), ascending), open);
  }
}

// Whether w is at most the kept ratio of center + k, for the lanes of the mask.
HWY_INLINE truths below_kept(const near_ratios& near, double_vector k, double_vector w,
                             truths mask) {
  const doubles d;
  const auto index = hn::Add(hn::IfThenElseZero(mask, k), every(near_ratios::reach));
  const auto places = hn::ConvertTo(hn::RebindToSigned<doubles>(), index);
  return hn::And(mask, hn::Le(w, hn::GatherIndex(d, near.ratio, places)));
}

// Second stage: proposals, kept ratios next to the mode, squeezes elsewhere. Leaves value and
// height of those that need the ratio itself, in rows that have been read already.
template <class Shape>
HWY_INLINE void judge(const Shape& shape, const near_ratios& near, undecided& left,
                      late_values& late) {
  const doubles d;
  left.pad(0.5, 0.5);
  const std::size_t count = left.size;
  left.size = 0;
  for (std::size_t i = 0; i < count; i += hn::Lanes(d)) {
    const proposal p = shape.propose(left.first.at(i), left.second.at(i));
    const auto at = left.place.at(i);
    const truths open = hn::And(p.possible, hn::FirstN(d, count - i));
    truths yes = hn::And(open, p.certain);
    truths rest = hn::And(open, hn::Not(p.certain));
    const auto k = hn::Sub(p.y, every(near.center));
    const truths is_near = hn::And(rest, hn::Le(hn::Abs(k), every(near_ratios::reach)));
    rest = hn::And(rest, hn::Not(is_near));
    truths test = is_near;
    if (near.kept) {
      yes = hn::Or(yes, below_kept(near, k, p.w, is_near));
      test = hn::FirstN(d, 0);
    }
    if (!hn::AllFalse(d, rest)) {
      const verdict v = shape.squeeze(p.y, p.w);
      yes = hn::Or(yes, hn::And(rest, v.yes));
      test = hn::Or(test, hn::And(rest, hn::Not(hn::Or(v.yes, v.no))));
    }
    late.add(p.y, at, yes);
    if (!hn::AllFalse(d, test))
      left.add(p.y, p.w, at, test);
  }
}

// Third stage: the ratio itself.
HWY_INLINE void compare(const log_ratio& ratio, double center, undecided& left, late_values& late) {
  const doubles d;
  left.pad(center, center);
  for (std::size_t i = 0; i < left.size; i += hn::Lanes(d)) {
    const auto y = left.first.at(i);
    const truths below = hn::Le(left.second.at(i), ratio_at(ratio, y));
    late.add(y, left.place.at(i), hn::And(below, hn::FirstN(d, left.size - i)));
  }
}

// Writes the images of the values that are not -1 and gives their number.
HWY_INLINE std::size_t deliver(const column& value, std::size_t count, const image& result,
                               std::int32_t* out) {
  const doubles d;
  const hn::Rebind<std::int32_t, doubles> d32;
  HWY_ALIGN std::int32_t values[candidate_room];
  std::size_t accepted = 0;
  for (std::size_t i = 0; i < count; i += hn::Lanes(d)) {
    const auto y = value.at(i);
    const truths kept = hn::And(hn::Ge(y, hn::Zero(d)), hn::FirstN(d, count - i));
    const auto x = hn::Add(every(result.origin), hn::Mul(every(result.sign), y));
    const auto bounded = hn::IfThenElse(hn::Lt(x, every(0x7FFFFFFF)), x, every(0x7FFFFFFF));
    hn::StoreU(hn::DemoteTo(d32, compressed(d, bounded, kept)), d32, values + accepted);
    accepted += hn::CountTrue(d, kept);
  }
  std::copy_n(values, accepted, out);
  return accepted;
}

// Writes the values of the accepted ones among `count` candidates and gives their number. A Shape
// is made from the set-up of a method and has
//   settles(u, v, y)  candidates accepted at sight, and their values
//   propose(u, v)     value and height of the others
//   squeeze(y, w)     a quick verdict away from the mode
template <class Shape, class Setup>
HWY_INLINE std::size_t accept(const Setup& setup, const double* uniforms, std::size_t count,
                              std::int32_t* out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const Shape shape(setup);
  column value;
  undecided left;
  late_values late;
  settle(shape, uniforms, count, value, left);
  judge(shape, setup.near, left, late);
  compare(setup.ratio, setup.near.center, left, late);
  for (std::size_t i = 0; i < late.size; ++i)
    value.row[static_cast<std::size_t>(late.place.row[i])] = late.value.row[i];
  return deliver(value, count, setup.result, out);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif  // per target
