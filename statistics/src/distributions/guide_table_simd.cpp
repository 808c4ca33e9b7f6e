// SPDX-License-Identifier: Apache-2.0
// Gathering guides for vectors of numbers.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/guide_table_simd.cpp"
#include <algorithm>

#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/guide_table.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

bool look_up_guides(const double* HWY_RESTRICT u, std::size_t n, double lo,
                    const std::vector<std::int32_t>& guides, std::int32_t* HWY_RESTRICT codes) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const hn::ScalableTag<double> d;
  const hn::Rebind<std::int32_t, decltype(d)> di;
  const std::size_t lanes = hn::Lanes(d);
  const auto cells = static_cast<double>(guides.size());
  const auto origin = hn::Set(d, lo);
  const auto scale = hn::Set(d, cells / (1 - lo));
  const auto last = hn::Set(d, cells - 0.5);
  auto signs = hn::Zero(di);
  std::size_t i = 0;
  for (; i + lanes <= n; i += lanes) {
    const auto place = hn::Mul(hn::Sub(hn::LoadU(d, u + i), origin), scale);
    const auto cell = hn::DemoteTo(di, hn::IfThenElse(hn::Lt(place, last), place, last));
    const auto code = hn::GatherIndex(di, guides.data(), cell);
    signs = hn::Or(signs, code);
    hn::StoreU(code, di, codes + i);
  }
  bool negative = !hn::AllFalse(di, hn::Lt(signs, hn::Zero(di)));
  for (; i < n; ++i) {
    const double place = (u[i] - lo) * (cells / (1 - lo));
    codes[i] = guides[static_cast<std::size_t>(std::min(place, cells - 0.5))];
    negative |= codes[i] < 0;
  }
  return negative;
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(look_up_guides);

bool look_up_guides(const double* u, std::size_t n, double lo,
                    const std::vector<std::int32_t>& guides, std::int32_t* codes) {
  return TARN_SIMD_CALL(look_up_guides)(u, n, lo, guides, codes);
}

}  // namespace tarn::statistics
#endif
