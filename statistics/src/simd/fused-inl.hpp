// SPDX-License-Identifier: Apache-2.0
// Multiply-adds with one rounding on every SIMD target. Where a target has no such instruction, the
// result of one is computed: floats through doubles rounded to odd (Boldo, Melquiond: Emulation of
// FMA and correctly rounded sums, IEEE Trans. Comp. 57, 2008), doubles by std::fma lane by lane.
// For sources that are compiled once per target: include after <hwy/highway.h>, inside no
// namespace.
#include <cmath>
#include <cstddef>

#if defined(TARN_FUSED_INL_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_FUSED_INL_HPP
#undef TARN_FUSED_INL_HPP
#else
#define TARN_FUSED_INL_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// x * scale + offset, rounded once.
#if HWY_NATIVE_FMA

template <class D>
HWY_INLINE hn::Vec<D> fused(D, hn::Vec<D> x, hn::Vec<D> scale, hn::Vec<D> offset) {
  return hn::MulAdd(x, scale, offset);
}

#else

template <class D>
HWY_INLINE hn::Vec<D> fused_by_lane(D d, hn::Vec<D> x, hn::Vec<D> scale, hn::Vec<D> offset) {
  using real = hn::TFromD<D>;
  constexpr std::size_t lanes = HWY_MAX_BYTES / sizeof(real);
  HWY_ALIGN real a[lanes], b[lanes], c[lanes];
  hn::Store(x, d, a);
  hn::Store(scale, d, b);
  hn::Store(offset, d, c);
  for (std::size_t i = 0; i < hn::Lanes(d); ++i)
    a[i] = std::fma(a[i], b[i], c[i]);
  return hn::Load(d, a);
}

#if HWY_TARGET != HWY_SCALAR

// a + b in double, rounded to odd: of the two doubles around an inexact sum, the one with an odd
// mantissa. Rounding that to float (53 >= 2 * 24 + 2 bits) gives the correctly rounded sum. The
// error of the sum is exact by Knuth's TwoSum.
template <class D>
HWY_INLINE hn::Vec<D> sum_rounded_to_odd(D d, hn::Vec<D> a, hn::Vec<D> b) {
  const hn::RebindToSigned<D> di;
  const auto sum = hn::Add(a, b);
  const auto b_part = hn::Sub(sum, a);
  const auto error = hn::Add(hn::Sub(a, hn::Sub(sum, b_part)), hn::Sub(b, b_part));
  const auto zero = hn::Zero(d);
  // Two comparisons instead of "not zero": the error of an infinite sum is not a number.
  const auto inexact = hn::Or(hn::Lt(error, zero), hn::Gt(error, zero));

  const auto bits = hn::BitCast(di, sum);
  const auto one = hn::Set(di, 1);
  const auto even = hn::Eq(hn::And(bits, one), hn::Zero(di));
  // Away from zero (+1) if the error has the sign of the sum, else towards it (-1).
  const auto step = hn::Or(hn::BroadcastSignBit(hn::Xor(bits, hn::BitCast(di, error))), one);
  const auto moved = hn::Add(bits, hn::IfThenElseZero(even, step));
  return hn::IfThenElse(inexact, hn::BitCast(d, moved), sum);
}

#endif

template <class D>
HWY_INLINE hn::Vec<D> fused(D d, hn::Vec<D> x, hn::Vec<D> scale, hn::Vec<D> offset) {
#if HWY_TARGET != HWY_SCALAR
  if constexpr (sizeof(hn::TFromD<D>) == 4) {
    const hn::Half<D> half;
    const hn::Rebind<double, hn::Half<D>> wide;
    const auto part = [&](auto x_part, auto scale_part, auto offset_part) {
      // The product of two floats is exact in double.
      const auto product = hn::Mul(hn::PromoteTo(wide, x_part), hn::PromoteTo(wide, scale_part));
      return hn::DemoteTo(half,
                          sum_rounded_to_odd(wide, product, hn::PromoteTo(wide, offset_part)));
    };
    return hn::Combine(
        d, part(hn::UpperHalf(half, x), hn::UpperHalf(half, scale), hn::UpperHalf(half, offset)),
        part(hn::LowerHalf(half, x), hn::LowerHalf(half, scale), hn::LowerHalf(half, offset)));
  }
#endif
  return fused_by_lane(d, x, scale, offset);
}

#endif  // HWY_NATIVE_FMA

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif  // per target
