// SPDX-License-Identifier: Apache-2.0
// The kernel of R250 for each SIMD target.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "engines/r250_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "engines/block_record.hpp"
#include "engines/r250.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::r250::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

void extend(std::uint32_t* words, std::size_t count) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const hn::CappedTag<std::uint32_t, block_step> d;
  const std::uint32_t* const end = words + whole_steps(count);
  for (; words != end; words += hn::Lanes(d)) {
    const auto oldest = hn::LoadU(d, words);
    const auto middle = hn::LoadU(d, words + (order - lag));
    hn::StoreU(hn::Xor(oldest, middle), d, words + order);
  }
}

}  // namespace tarn::statistics::r250::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics::r250 {

HWY_EXPORT(extend);

void extend(std::uint32_t* words, std::size_t count) {
  TARN_SIMD_CALL(extend)(words, count);
}

}  // namespace tarn::statistics::r250
#endif
