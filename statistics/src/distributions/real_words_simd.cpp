// SPDX-License-Identifier: Apache-2.0
// Kernels that turn words into reals and reals into integers. They run over blocks that lie in the
// nearest cache.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/real_words_simd.cpp"
#include <limits>

#include <hwy/cache_control.h>
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/real_words.hpp"
#include "simd/fused-inl.hpp"
#include "simd/map-inl.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

template <class D, class Word, class ToReal>
HWY_INLINE void words_to_reals(D d, const Word* words, std::size_t n, affine<hn::TFromD<D>> map,
                               const finish<hn::TFromD<D>>& end, hn::TFromD<D>* out,
                               const ToReal& to_real) {
  const auto scale = hn::Set(d, map.scale);
  const auto offset = hn::Set(d, map.offset);
  if (end.clamp)
    map_all(d, words, n, end.streaming, out, [&](auto w) {
      return clamped(d, fused(d, to_real(w), scale, offset), end.low, end.high);
    });
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
  // bits): the bits that a double cannot hold leave their trace in the last one that it can. Words
  // that a double holds whole go through it as they are.
  const auto lost = hn::Set(du, (std::uint64_t{1} << (wide_word_bits - 53)) - 1);
  const auto last = hn::Set(du, std::uint64_t{1} << (wide_word_bits - 53));
  const auto beyond = hn::Set(du, std::uint64_t{1} << 53);
  words_to_reals(d, reinterpret_cast<const std::uint64_t*>(words), n, map, end, out, [&](auto w) {
    const auto trace = hn::IfThenZeroElse(hn::Eq(hn::And(w, lost), hn::Zero(du)), last);
    const auto odd = hn::AndNot(lost, hn::Or(w, trace));
    return hn::DemoteTo(d, hn::ConvertTo(dd, hn::IfThenElse(hn::Lt(w, beyond), w, odd)));
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
