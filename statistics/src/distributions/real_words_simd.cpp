// SPDX-License-Identifier: Apache-2.0
// Kernels that turn words into reals and reals into integers. They run over blocks that lie in the
// nearest cache. Where a target has no fused multiply-add, the result of one is computed: floats
// through doubles rounded to odd (Boldo, Melquiond: Emulation of FMA and correctly rounded sums,
// IEEE Trans. Comp. 57, 2008), doubles by std::fma lane by lane.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/real_words_simd.cpp"
#include <cmath>
#include <cstring>
#include <limits>

#include <hwy/cache_control.h>
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/real_words.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// ---- x * scale + offset, rounded once -------------------------------------------------------

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

// ---- Loops ----------------------------------------------------------------------------------

// out[i] = turn(in[i]) for whole vectors of D and, through a padded one, for the rest.
template <bool Streaming, class D, class From, class Turn>
HWY_INLINE void map_loop(D d, const From* HWY_RESTRICT in, std::size_t n,
                         hn::TFromD<D>* HWY_RESTRICT out, const Turn& turn) {
  using to = hn::TFromD<D>;
  const hn::Rebind<From, D> d_in;
  const std::size_t lanes = hn::Lanes(d);
  std::size_t i = 0;
  for (; i + lanes <= n; i += lanes) {
    const auto result = turn(hn::LoadU(d_in, in + i));
    if constexpr (Streaming)
      hn::Stream(result, d, out + i);
    else
      hn::StoreU(result, d, out + i);
  }
  if (const std::size_t rest = n - i; rest != 0) {
    HWY_ALIGN From padded[HWY_MAX_BYTES / sizeof(to)] = {};
    HWY_ALIGN to results[HWY_MAX_BYTES / sizeof(to)];
    std::memcpy(padded, in + i, rest * sizeof(From));
    hn::Store(turn(hn::Load(d_in, padded)), d, results);
    std::memcpy(out + i, results, rest * sizeof(to));
  }
}

template <class D, class From, class Turn>
HWY_INLINE void map_all(D d, const From* in, std::size_t n, bool streaming, hn::TFromD<D>* out,
                        const Turn& turn) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const std::size_t vector_bytes = hn::Lanes(d) * sizeof(hn::TFromD<D>);
  if (streaming && reinterpret_cast<std::uintptr_t>(out) % vector_bytes == 0)
    map_loop<true>(d, in, n, out, turn);
  else
    map_loop<false>(d, in, n, out, turn);
}

// ---- Kernels --------------------------------------------------------------------------------

template <class D>
HWY_INLINE hn::Vec<D> clamped(D d, hn::Vec<D> x, const finish<hn::TFromD<D>>& end) {
  // Comparisons instead of Min and Max: their choice among zeros and not-a-numbers depends on the
  // target.
  const auto low = hn::Set(d, end.low);
  const auto high = hn::Set(d, end.high);
  const auto raised = hn::IfThenElse(hn::Gt(x, low), x, low);
  return hn::IfThenElse(hn::Lt(raised, high), raised, high);
}

template <class D, class Word, class ToReal>
HWY_INLINE void words_to_reals(D d, const Word* words, std::size_t n, affine<hn::TFromD<D>> map,
                               const finish<hn::TFromD<D>>& end, hn::TFromD<D>* out,
                               const ToReal& to_real) {
  const auto scale = hn::Set(d, map.scale);
  const auto offset = hn::Set(d, map.offset);
  if (end.clamp)
    map_all(d, words, n, end.streaming, out,
            [&](auto w) { return clamped(d, fused(d, to_real(w), scale, offset), end); });
  else
    map_all(d, words, n, end.streaming, out,
            [&](auto w) { return fused(d, to_real(w), scale, offset); });
}

void signed_words_to_float(const std::uint32_t* words, std::size_t n, affine<float> map,
                           const finish<float>& end, float* out) {
  const hn::ScalableTag<float> d;
  const hn::RebindToSigned<decltype(d)> di;
  words_to_reals(d, words, n, map, end, out,
                 [&](auto w) { return hn::ConvertTo(d, hn::BitCast(di, w)); });
}

void signed_words_to_double(const std::uint32_t* words, std::size_t n, affine<double> map,
                            const finish<double>& end, double* out) {
  const hn::ScalableTag<double> d;
  const hn::Rebind<std::int32_t, decltype(d)> di;
  words_to_reals(d, words, n, map, end, out,
                 [&](auto w) { return hn::PromoteTo(d, hn::BitCast(di, w)); });
}

void unsigned_words_to_float(const std::uint32_t* words, std::size_t n, affine<float> map,
                             const finish<float>& end, float* out) {
  const hn::ScalableTag<float> d;
  words_to_reals(d, words, n, map, end, out, [&](auto w) { return hn::ConvertTo(d, w); });
}

void unsigned_words_to_double(const std::uint32_t* words, std::size_t n, affine<double> map,
                              const finish<double>& end, double* out) {
  const hn::ScalableTag<double> d;
  const hn::ScalableTag<std::uint64_t> du;
  words_to_reals(d, words, n, map, end, out,
                 [&](auto w) { return hn::ConvertTo(d, hn::PromoteTo(du, w)); });
}

void wide_words_to_float(const std::uint32_t* words, std::size_t n, affine<float> map,
                         const finish<float>& end, float* out) {
  const hn::ScalableTag<std::uint64_t> du;
  const hn::RebindToFloat<decltype(du)> dd;
  const hn::Rebind<float, decltype(du)> d;
  // Rounding to float by way of double is right if the first step rounds to odd (53 >= 24 + 2
  // bits): the bits that a double cannot hold leave their trace in the last one that it can.
  const auto lost = hn::Set(du, (std::uint64_t{1} << (wide_word_bits - 53)) - 1);
  const auto last = hn::Set(du, std::uint64_t{1} << (wide_word_bits - 53));
  words_to_reals(d, reinterpret_cast<const std::uint64_t*>(words), n, map, end, out, [&](auto w) {
    const auto trace = hn::IfThenZeroElse(hn::Eq(hn::And(w, lost), hn::Zero(du)), last);
    return hn::DemoteTo(d, hn::ConvertTo(dd, hn::AndNot(lost, hn::Or(w, trace))));
  });
}

void wide_words_to_double(const std::uint32_t* words, std::size_t n, affine<double> map,
                          const finish<double>& end, double* out) {
  const hn::ScalableTag<double> d;
  words_to_reals(d, reinterpret_cast<const std::uint64_t*>(words), n, map, end, out,
                 [&](auto w) { return hn::ConvertTo(d, w); });
}

void floor_to_int32(const float* x, std::size_t n, bool streaming, std::int32_t* out) {
  const hn::ScalableTag<std::int32_t> d;
  const hn::Rebind<float, decltype(d)> df;
  map_all(d, x, n, streaming, out, [&](auto v) {
    // 2^31 is the first float above the range; below the range the conversion itself gives the
    // least integer.
    const auto above = hn::Ge(v, hn::Set(df, 0x1p31f));
    const auto inside = hn::IfThenElse(above, hn::Zero(df), hn::Floor(v));
    const auto greatest = hn::Set(d, std::numeric_limits<std::int32_t>::max());
    return hn::IfThenElse(hn::RebindMask(d, above), greatest, hn::ConvertTo(d, inside));
  });
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(signed_words_to_float);
HWY_EXPORT(signed_words_to_double);
HWY_EXPORT(unsigned_words_to_float);
HWY_EXPORT(unsigned_words_to_double);
HWY_EXPORT(wide_words_to_float);
HWY_EXPORT(wide_words_to_double);
HWY_EXPORT(floor_to_int32);

void signed_words_to_float(const std::uint32_t* words, std::size_t n, affine<float> map,
                           const finish<float>& end, float* out) {
  TARN_SIMD_CALL(signed_words_to_float)(words, n, map, end, out);
}

void signed_words_to_double(const std::uint32_t* words, std::size_t n, affine<double> map,
                            const finish<double>& end, double* out) {
  TARN_SIMD_CALL(signed_words_to_double)(words, n, map, end, out);
}

void unsigned_words_to_float(const std::uint32_t* words, std::size_t n, affine<float> map,
                             const finish<float>& end, float* out) {
  TARN_SIMD_CALL(unsigned_words_to_float)(words, n, map, end, out);
}

void unsigned_words_to_double(const std::uint32_t* words, std::size_t n, affine<double> map,
                              const finish<double>& end, double* out) {
  TARN_SIMD_CALL(unsigned_words_to_double)(words, n, map, end, out);
}

void wide_words_to_float(const std::uint32_t* words, std::size_t n, affine<float> map,
                         const finish<float>& end, float* out) {
  TARN_SIMD_CALL(wide_words_to_float)(words, n, map, end, out);
}

void wide_words_to_double(const std::uint32_t* words, std::size_t n, affine<double> map,
                          const finish<double>& end, double* out) {
  TARN_SIMD_CALL(wide_words_to_double)(words, n, map, end, out);
}

void floor_to_int32(const float* x, std::size_t n, bool streaming, std::int32_t* out) {
  TARN_SIMD_CALL(floor_to_int32)(x, n, streaming, out);
}

void flush_streaming() {
  hwy::FlushStream();
}

}  // namespace tarn::statistics
#endif
