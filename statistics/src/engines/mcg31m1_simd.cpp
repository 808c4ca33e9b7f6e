// SPDX-License-Identifier: Apache-2.0
// Runs of words of mcg31m1 for each SIMD target.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "engines/mcg31m1_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "engines/mcg31m1.hpp"
#include "engines/multiplicative_simd.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::mcg31m1::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

struct lanes {
  using group = mcg31m1::group;

#if HWY_TARGET != HWY_SCALAR
  using tag = hn::ScalableTag<std::uint32_t>;
  using pair_tag = hn::RepartitionToWide<tag>;
  using vector = hn::Vec<tag>;

  // Twice the multiplier: then bit 31 of a product is bit 32, and its two parts are the halves of
  // a 64-bit lane.
  static HWY_INLINE vector factor(std::uint32_t a) {
    return hn::Set(tag(), 2 * a);
  }

  static HWY_INLINE vector multiply(vector v, vector factor) {
    const tag d;
    const pair_tag pairs;
    const auto odd_half = [&](vector x) {
      return hn::BitCast(d, hn::ShiftRight<32>(hn::BitCast(pairs, x)));
    };
    const auto even = hn::MulEven(v, factor);
    const auto odd = hn::MulEven(odd_half(v), odd_half(factor));
    const vector high = hn::OddEven(hn::BitCast(d, odd), odd_half(hn::BitCast(d, even)));
    const vector low = hn::OddEven(hn::BitCast(d, hn::ShiftLeft<32>(odd)), hn::BitCast(d, even));
    const vector sum = hn::Add(high, hn::ShiftRight<1>(low));
    // Below the modulus the difference wraps to a large number.
    return hn::Min(sum, hn::Sub(sum, hn::Set(d, group::modulus)));
  }

  static HWY_INLINE void store(vector v, std::uint32_t* out) {
    hn::StoreU(v, tag(), out);
  }
#endif
};

std::uint32_t write_words(std::uint32_t x, std::uint32_t a, std::size_t n, std::uint32_t* out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  return statistics::HWY_NAMESPACE::write_multiplicative<lanes>(x, a, n, out);
}

}  // namespace tarn::statistics::mcg31m1::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics::mcg31m1 {

HWY_EXPORT(write_words);

group::number group::write_words(number x, number a, std::size_t n, std::uint32_t* out) {
  return TARN_SIMD_CALL(write_words)(x, a, n, out);
}

}  // namespace tarn::statistics::mcg31m1
#endif
