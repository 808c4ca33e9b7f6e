// SPDX-License-Identifier: Apache-2.0
// Bernoulli and geometric variates in vectors.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/trials_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/trials.hpp"
#include "simd/map-inl.hpp"
#include "simd/vector_math-inl.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

using real_tag = hn::ScalableTag<double>;
using integer_tag = hn::Rebind<std::int32_t, real_tag>;

void bernoulli(const double* u, std::size_t n, double p, std::int32_t* out) {
  const real_tag d;
  // Above every u if p is 1.
  const auto bound = hn::Set(d, p < 1 ? p : 2);
  const auto one = hn::Set(d, 1.0);
  map_all(integer_tag(), u, n, false, out, [&](auto x) HWY_ATTR {
    return hn::DemoteTo(integer_tag(), hn::IfThenElseZero(hn::Lt(x, bound), one));
  });
}

void geometric(const double* u, std::size_t n, const geometric_law& law, std::int32_t* out) {
  const real_tag d;
  const std::size_t lanes = hn::Lanes(d);
  const auto zero = hn::Zero(d);
  // Quotients from 2^31 on all give the greatest integer and need no second look.
  const auto beyond = hn::Set(d, 0x1p31);
  const auto settled = hn::Set(d, 0x1p31 - 0.5);
  const auto log_of_zero = hn::Set(d, -744.44007192138122);
  const auto inverse_log = hn::Set(d, law.inverse_log);
  // The logarithm, its factor and their product err by less than 6 units in the last place.
  const auto doubt = hn::Set(d, 0x1p-49);
  map_all(integer_tag(), u, n, false, out, [&](auto x) HWY_ATTR {
    const auto nothing = hn::Eq(x, zero);
    const auto log = hn::IfThenElse(nothing, log_of_zero, vector_log(x));
    const auto product = hn::Mul(log, inverse_log);
    const auto quotient = hn::IfThenElse(hn::Lt(product, beyond), product, settled);
    const auto nearest = hn::Round(quotient);
    auto whole = hn::Floor(quotient);
    const auto distance = hn::Abs(hn::Sub(quotient, nearest));
    const auto close = hn::Le(distance, hn::Mul(quotient, doubt));
    const auto open = hn::AndNot(nothing, hn::And(hn::Gt(nearest, zero), close));
    if (!hn::AllFalse(d, open)) {
      HWY_ALIGN double numbers[HWY_MAX_BYTES / sizeof(double)];
      HWY_ALIGN double values[HWY_MAX_BYTES / sizeof(double)];
      hn::Store(x, d, numbers);
      hn::Store(nearest, d, values);
      for (std::size_t i = 0; i < lanes; ++i)
        values[i] -= law.reaches(numbers[i], values[i]) ? 0 : 1;
      whole = hn::IfThenElse(open, hn::Load(d, values), whole);
    }
    return hn::DemoteTo(integer_tag(), whole);
  });
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(bernoulli);
HWY_EXPORT(geometric);

void bernoulli(const double* u, std::size_t n, double p, std::int32_t* out) {
  TARN_SIMD_CALL(bernoulli)(u, n, p, out);
}

void geometric(const double* u, std::size_t n, const geometric_law& law, std::int32_t* out) {
  TARN_SIMD_CALL(geometric)(u, n, law, out);
}

}  // namespace tarn::statistics
#endif
