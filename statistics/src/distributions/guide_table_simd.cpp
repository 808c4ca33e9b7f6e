// SPDX-License-Identifier: Apache-2.0
// Vectors of numbers climb the steps of a cdf, or gather guides.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/guide_table_simd.cpp"
#include <algorithm>

#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/guide_table.hpp"
#include "simd/map-inl.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

void count_steps(const double* u, std::size_t n, const double* cdf, std::int32_t* out) {
  const hn::ScalableTag<double> d;
  const hn::Rebind<std::int32_t, decltype(d)> di;
  const auto greatest = hn::Set(d, guide_table::greatest);
  const auto one = hn::Set(d, 1.0);
  map_all(di, u, n, false, out, [&](auto x) HWY_ATTR {
    const auto number = hn::IfThenElse(hn::Lt(x, greatest), x, greatest);
    auto count = hn::Zero(d);
    for (const double* step = cdf;; ++step) {
      const auto reached = hn::Ge(number, hn::Set(d, *step));
      if (hn::AllFalse(d, reached))
        return hn::DemoteTo(di, count);
      count = hn::Add(count, hn::IfThenElseZero(reached, one));
    }
  });
}

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

HWY_EXPORT(count_steps);
HWY_EXPORT(look_up_guides);

void count_steps(const double* u, std::size_t n, const double* cdf, std::int32_t* out) {
  TARN_SIMD_CALL(count_steps)(u, n, cdf, out);
}

bool look_up_guides(const double* u, std::size_t n, double lo,
                    const std::vector<std::int32_t>& guides, std::int32_t* codes) {
  return TARN_SIMD_CALL(look_up_guides)(u, n, lo, guides, codes);
}

}  // namespace tarn::statistics
#endif
