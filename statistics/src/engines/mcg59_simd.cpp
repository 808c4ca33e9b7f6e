// SPDX-License-Identifier: Apache-2.0
// Runs of words of mcg59 for each SIMD target.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "engines/mcg59_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "engines/mcg59.hpp"
#include "engines/multiplicative_simd.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::mcg59::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// Lanes keep all 64 bits of a product: the low 59 are right, and the others are cut off in stores.
struct lanes {
  using group = mcg59::group;

#if HWY_TARGET != HWY_SCALAR
  using tag = hn::ScalableTag<std::uint64_t>;
  using part_tag = hn::RepartitionToNarrow<tag>;
  using vector = hn::Vec<tag>;

  static HWY_INLINE vector factor(std::uint64_t a) {
    return hn::Set(tag(), a);
  }

  static HWY_INLINE vector multiply(vector v, vector factor) {
    return hn::Mul(v, factor);
  }

  static HWY_INLINE void store(vector v, std::uint32_t* out) {
    const part_tag d;
    hn::StoreU(hn::BitCast(d, hn::And(v, hn::Set(tag(), group::mask))), d, out);
  }
#endif
};

std::uint64_t write_words(std::uint64_t x, std::uint64_t a, std::size_t n, std::uint32_t* out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  return statistics::HWY_NAMESPACE::write_multiplicative<lanes>(x, a, n, out);
}

}  // namespace tarn::statistics::mcg59::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics::mcg59 {

HWY_EXPORT(write_words);

group::number group::write_words(number x, number a, std::size_t n, std::uint32_t* out) {
  return TARN_SIMD_CALL(write_words)(x, a, n, out);
}

}  // namespace tarn::statistics::mcg59
#endif
