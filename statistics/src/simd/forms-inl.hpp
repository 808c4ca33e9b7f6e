// SPDX-License-Identifier: Apache-2.0
// What the kernels of closed formulas share: guarded logarithms and the placing of a
// standard variate. For sources that are compiled once per target: include after
// <hwy/highway.h>, inside no namespace.
#include <limits>
#include <type_traits>

#include "distributions/placement.hpp"
#include "simd/inline_math-inl.hpp"
#include "simd/map-inl.hpp"

#if defined(TARN_FORMS_INL_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_FORMS_INL_HPP
#undef TARN_FORMS_INL_HPP
#else
#define TARN_FORMS_INL_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// What stands for ln(0), so that no result is infinite: about the logarithm of the least
// subnormal number of the type.
template <class Real>
inline constexpr Real log_of_zero = std::is_same_v<Real, float>
                                        ? static_cast<Real>(-0x1.9D1DAp6)
                                        : static_cast<Real>(-0x1.74385446D71C3p9);

// ln(u) for 0 <= u <= 1.
template <class D>
HWY_INLINE hn::Vec<D> guarded_log(D d, hn::Vec<D> u) {
  const auto log_zero = hn::Set(d, log_of_zero<hn::TFromD<D>>);
  return hn::IfThenElse(hn::Eq(u, hn::Zero(d)), log_zero, inline_log<base::e>(d, u));
}

// A placement in vectors.
template <class D>
class placing {
 public:
  placing(D d, const placement<hn::TFromD<D>>& to)
      : d_(d),
        scale_(hn::Set(d, to.map.scale)),
        offset_(hn::Set(d, to.map.offset)),
        least_(to.least) {}

  HWY_INLINE hn::Vec<D> operator()(hn::Vec<D> z) const {
    const auto x = hn::Add(hn::Mul(z, scale_), offset_);
    return clamped(d_, x, least_, std::numeric_limits<hn::TFromD<D>>::max());
  }

 private:
  D d_;
  hn::Vec<D> scale_, offset_;
  hn::TFromD<D> least_;
};

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif  // per target
