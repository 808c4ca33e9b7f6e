// SPDX-License-Identifier: Apache-2.0
// The kernels of MT2203 for each SIMD target.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "engines/mt2203_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "engines/mt2203.hpp"
#include "engines/twister_simd.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::mt2203::HWY_NAMESPACE {

void extend(const twister_constants& constants, std::uint32_t* words, std::size_t count) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  statistics::HWY_NAMESPACE::extend_twister<shape>(constants, words, count);
}

void temper(const twister_constants& constants, const std::uint32_t* words, std::size_t n,
            std::uint32_t* out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  statistics::HWY_NAMESPACE::temper<shape>(constants, words, n, out);
}

}  // namespace tarn::statistics::mt2203::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics::mt2203 {

HWY_EXPORT(extend);
HWY_EXPORT(temper);

void extend(const twister_constants& constants, std::uint32_t* words, std::size_t count) {
  TARN_SIMD_CALL(extend)(constants, words, count);
}

void temper(const twister_constants& constants, const std::uint32_t* words, std::size_t n,
            std::uint32_t* out) {
  TARN_SIMD_CALL(temper)(constants, words, n, out);
}

}  // namespace tarn::statistics::mt2203
#endif
