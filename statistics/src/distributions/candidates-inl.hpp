// SPDX-License-Identifier: Apache-2.0
// What kernels that judge candidates share. For sources that are compiled once per target: include
// after <hwy/highway.h>, inside no namespace.
#include <cstddef>
#include <cstdint>

#include "distributions/candidates.hpp"
#include "simd/compressed-inl.hpp"
#include "simd/near_one-inl.hpp"
#include "simd/target.hpp"

#if defined(TARN_CANDIDATES_INL_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_CANDIDATES_INL_HPP
#undef TARN_CANDIDATES_INL_HPP
#else
#define TARN_CANDIDATES_INL_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

using real_tag = hn::ScalableTag<double>;
using index_tag = hn::RebindToSigned<real_tag>;
using reals = hn::Vec<real_tag>;
using real_mask = hn::Mask<real_tag>;

HWY_INLINE reals constant(double x) {
  return hn::Set(real_tag(), x);
}

// A uniform of [0, 1], its ends moved inside: 0 to 2^-64, below the least step of any engine, and
// 1, to which words of 59 bits can round, to the greatest double below.
HWY_INLINE reals inner(reals u) {
  const auto least = constant(0x1p-64);
  const auto greatest = constant(1 - 0x1p-53);
  const auto raised = hn::IfThenElse(hn::Lt(u, least), least, u);
  return hn::IfThenElse(hn::Gt(raised, greatest), greatest, raised);
}

HWY_INLINE reals or_rejected(real_mask accepted, reals value) {
  return hn::IfThenElse(accepted, value, constant(rejected));
}

// value = turn(i) for the candidates from i on, a vector at a time.
template <class Turn>
HWY_INLINE void for_candidates(candidates& block, std::size_t n, const Turn& turn) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const real_tag d;
  for (std::size_t i = 0; i < n; i += hn::Lanes(d))
    hn::Store(turn(i), d, block.value + i);
}

// Candidates that a quick test leaves open. They are few: listed, whole vectors of them get the
// full test, and it does not matter to any of them which others share its vector.
class open_list {
 public:
  HWY_INLINE void add(std::size_t i, real_mask open) {
    const index_tag di;
    const auto places = hn::Iota(di, static_cast<std::int64_t>(i));
    hn::StoreU(compressed(di, places, hn::RebindMask(di, open)), di, place_ + size_);
    size_ += hn::CountTrue(real_tag(), open);
  }

  // Rejects those for which accepts(gather) does not hold, where gather(column) gives their numbers
  // in a column of the block.
  template <class Accepts>
  HWY_INLINE void settle(candidates& block, const Accepts& accepts) {
    if (size_ == 0)
      return;
    const real_tag d;
    const index_tag di;
    const std::size_t lanes = hn::Lanes(d);
    for (std::size_t k = 0; k < lanes; ++k)  // a whole last vector: one of them several times
      place_[size_ + k] = place_[0];
    for (std::size_t k = 0; k < size_; k += lanes) {
      const auto place = hn::LoadU(di, place_ + k);
      const auto gather = [&](const double* column)
                              HWY_ATTR { return hn::GatherIndex(d, column, place); };
      const auto kept = or_rejected(accepts(gather), gather(block.value));
      hn::ScatterIndex(kept, d, block.value, place);
    }
  }

 private:
  std::int64_t place_[block_candidates + most_lanes];
  std::size_t size_ = 0;
};

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif  // per target
