// SPDX-License-Identifier: Apache-2.0
// Lanes of a mask moved together, for vectors of 64-bit lanes. For sources that are compiled once
// per target: include after <hwy/highway.h>, inside no namespace.
#if defined(TARN_COMPRESSED_INL_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_COMPRESSED_INL_HPP
#undef TARN_COMPRESSED_INL_HPP
#else
#define TARN_COMPRESSED_INL_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

// The lanes of the mask in front, in their order; the others behind them or lost. Highway 1.0 looks
// the order of eight lanes up in a table, which GCC copies to the stack at each use.
template <class D>
HWY_INLINE hwy::HWY_NAMESPACE::Vec<D> compressed(D, hwy::HWY_NAMESPACE::Vec<D> v,
                                                 hwy::HWY_NAMESPACE::Mask<D> mask) {
  using lane = hwy::HWY_NAMESPACE::TFromD<D>;
  static_assert(sizeof(lane) == 8, "lanes of 64 bits");
#if HWY_TARGET == HWY_AVX3
  if constexpr (hwy::IsFloat<lane>())
    return hwy::HWY_NAMESPACE::Vec<D>{_mm512_maskz_compress_pd(mask.raw, v.raw)};
  else
    return hwy::HWY_NAMESPACE::Vec<D>{_mm512_maskz_compress_epi64(mask.raw, v.raw)};
#else
  return hwy::HWY_NAMESPACE::Compress(v, mask);
#endif
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif  // per target
