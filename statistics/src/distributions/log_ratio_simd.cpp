// SPDX-License-Identifier: Apache-2.0
// Ratios of probabilities of a few values, for the set-ups of rejections.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/log_ratio_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/log_ratio-inl.hpp"
#include "simd/map-inl.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

void ratios_of(const log_ratio& r, const double* y, std::size_t n, double* ratios) {
  map_all(doubles(), y, n, false, ratios, [&](double_vector v) { return ratio_at(r, v); });
}

void factorial_remainders(const double* x, std::size_t n, double* remainders) {
  map_all(doubles(), x, n, false, remainders,
          [](double_vector v) { return factorial_remainder(v); });
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(ratios_of);
HWY_EXPORT(factorial_remainders);

void ratios_of(const log_ratio& r, const double* y, std::size_t n, double* ratios) {
  TARN_SIMD_CALL(ratios_of)(r, y, n, ratios);
}

void factorial_remainders(const double* x, std::size_t n, double* remainders) {
  TARN_SIMD_CALL(factorial_remainders)(x, n, remainders);
}

void log_ratio::add(double sign, double direction, double center) {
  factorial_term& next = term[terms++];
  next = {sign, direction, center, 0};
  factorial_remainders(&center, 1, &next.remainder);
}

void log_ratio::add_quotient(double difference) {
  gap = difference;
  add(1, 1, reference + gap);
  add(-1, 1, reference);
}

}  // namespace tarn::statistics
#endif
