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

// Writes the values of the accepted ones among `count` candidates and gives their number. A Shape
// is made from the set-up of a method and has
//   settles(u, v, y)  candidates accepted at sight, and their values
//   propose(u, v)     value and height of the others
//   squeeze(y, w)     a quick verdict away from the mode
template <class Shape, class Setup>
HWY_INLINE std::size_t accept(const Setup& setup, const double* uniforms, std::size_t count,
                              std::int32_t* out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const doubles d;
  const std::size_t lanes = hn::Lanes(d);
  const Shape shape(setup);
  const near_ratios& near = setup.near;

  // The values, -1 for the rejected ones.
  column value;
  // What is undecided: two numbers and the place of the value.
  column first, second, place;
  const auto ascending = hn::Iota(d, 0);
  std::size_t undecided = 0;
  for (std::size_t i = 0; i < count; i += lanes) {
    double_vector u, v, y = every(-1);
    hn::LoadInterleaved2(d, uniforms + 2 * i, u, v);
    const truths settled = shape.settles(u, v, y);
    hn::StoreU(hn::IfThenElse(settled, y, every(-1)), d, value.row + i);
    const truths open = hn::And(hn::Not(settled), hn::FirstN(d, count - i));
    first.append(undecided, u, open);
    second.append(undecided, v, open);
    place.append(undecided, hn::Add(every(static_cast<double>(i)), ascending), open);
    undecided += hn::CountTrue(d, open);
  }

  // Accepted values with their places. Each stage overwrites rows that it has read already.
  column late, late_place;
  std::size_t found = 0, tests = 0;
  first.append(undecided, every(0.5), hn::FirstN(d, lanes));
  second.append(undecided, every(0.5), hn::FirstN(d, lanes));
  for (std::size_t i = 0; i < undecided; i += lanes) {
    const proposal p = shape.propose(first.at(i), second.at(i));
    const auto at = place.at(i);
    const truths open = hn::And(p.possible, hn::FirstN(d, undecided - i));
    truths yes = hn::And(open, p.certain);
    truths rest = hn::And(open, hn::Not(p.certain));
    const auto k = hn::Sub(p.y, every(near.center));
    const truths is_near = hn::And(rest, hn::Le(hn::Abs(k), every(near_ratios::reach)));
    rest = hn::And(rest, hn::Not(is_near));
    truths test = is_near;
    if (near.kept) {
      const hn::RebindToSigned<doubles> di;
      const auto index = hn::Add(hn::IfThenElseZero(is_near, k), every(near_ratios::reach));
      const auto ratio = hn::GatherIndex(d, near.ratio, hn::ConvertTo(di, index));
      yes = hn::Or(yes, hn::And(is_near, hn::Le(p.w, ratio)));
      test = hn::FirstN(d, 0);
    }
    if (!hn::AllFalse(d, rest)) {
      const verdict v = shape.squeeze(p.y, p.w);
      yes = hn::Or(yes, hn::And(rest, v.yes));
      test = hn::Or(test, hn::And(rest, hn::Not(hn::Or(v.yes, v.no))));
    }
    late.append(found, p.y, yes);
    late_place.append(found, at, yes);
    found += hn::CountTrue(d, yes);
    if (!hn::AllFalse(d, test)) {
      first.append(tests, p.y, test);
      second.append(tests, p.w, test);
      place.append(tests, at, test);
      tests += hn::CountTrue(d, test);
    }
  }

  first.append(tests, every(near.center), hn::FirstN(d, lanes));
  for (std::size_t i = 0; i < tests; i += lanes) {
    const auto y = first.at(i);
    const truths yes =
        hn::And(hn::Le(second.at(i), ratio_at(setup.ratio, y)), hn::FirstN(d, tests - i));
    late.append(found, y, yes);
    late_place.append(found, place.at(i), yes);
    found += hn::CountTrue(d, yes);
  }
  for (std::size_t i = 0; i < found; ++i)
    value.row[static_cast<std::size_t>(late_place.row[i])] = late.row[i];

  std::size_t accepted = 0;
  const hn::Rebind<std::int32_t, doubles> d32;
  HWY_ALIGN std::int32_t values[candidate_room];
  for (std::size_t i = 0; i < count; i += lanes) {
    const auto y = value.at(i);
    const truths kept = hn::And(hn::Ge(y, hn::Zero(d)), hn::FirstN(d, count - i));
    const auto x = hn::Add(every(setup.result.origin), hn::Mul(every(setup.result.sign), y));
    const auto bounded = hn::IfThenElse(hn::Lt(x, every(0x7FFFFFFF)), x, every(0x7FFFFFFF));
    hn::StoreU(hn::DemoteTo(d32, compressed(d, bounded, kept)), d32, values + accepted);
    accepted += hn::CountTrue(d, kept);
  }
  std::copy_n(values, accepted, out);
  return accepted;
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif  // per target
