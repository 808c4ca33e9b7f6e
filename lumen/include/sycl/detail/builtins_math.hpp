// SPDX-License-Identifier: Apache-2.0
// The math functions of SYCL 2020, section 4.17.5. On the host each is the C library's own where
// there is one, in code for GPUs that of the CUDA math library, under the same names; mad is fused,
// so that it gives the same bits wherever it runs.
#pragma once

#include <cmath>
#include <cstdint>

#include "bit.hpp"
#include "builtins_lift.hpp"
#include "config.hpp"
#include "real_functions.hpp"

LUMEN_NAMESPACE_BEGIN

LUMEN_REAL_1(acos, std::acos(x))
LUMEN_REAL_1(acosh, std::acosh(x))
LUMEN_REAL_1(acospi, std::acos(x) / detail::pi_of<decltype(x)>)
LUMEN_REAL_1(asin, std::asin(x))
LUMEN_REAL_1(asinh, std::asinh(x))
LUMEN_REAL_1(asinpi, std::asin(x) / detail::pi_of<decltype(x)>)
LUMEN_REAL_1(atan, std::atan(x))
LUMEN_REAL_1(atanh, std::atanh(x))
LUMEN_REAL_1(atanpi, std::atan(x) / detail::pi_of<decltype(x)>)
LUMEN_REAL_1(cbrt, std::cbrt(x))
LUMEN_REAL_1(ceil, std::ceil(x))
LUMEN_REAL_1(cos, std::cos(x))
LUMEN_REAL_1(cosh, std::cosh(x))
LUMEN_REAL_1(cospi, detail::cos_pi(x))
LUMEN_REAL_1(erf, std::erf(x))
LUMEN_REAL_1(erfc, std::erfc(x))
LUMEN_REAL_1(exp, std::exp(x))
LUMEN_REAL_1(exp10, detail::power_of_ten(x))
LUMEN_REAL_1(exp2, std::exp2(x))
LUMEN_REAL_1(expm1, std::expm1(x))
LUMEN_REAL_1(fabs, std::fabs(x))
LUMEN_REAL_1(floor, std::floor(x))
LUMEN_REAL_1(lgamma, detail::log_gamma(x))
LUMEN_REAL_1(log, std::log(x))
LUMEN_REAL_1(log10, std::log10(x))
LUMEN_REAL_1(log1p, std::log1p(x))
LUMEN_REAL_1(log2, std::log2(x))
LUMEN_REAL_1(logb, std::logb(x))
LUMEN_REAL_1(rint, std::rint(x))
LUMEN_REAL_1(round, std::round(x))
LUMEN_REAL_1(rsqrt, detail::reciprocal_root(x))
LUMEN_REAL_1(sin, std::sin(x))
LUMEN_REAL_1(sinh, std::sinh(x))
LUMEN_REAL_1(sinpi, detail::sin_pi(x))
LUMEN_REAL_1(sqrt, std::sqrt(x))
LUMEN_REAL_1(tan, std::tan(x))
LUMEN_REAL_1(tanh, std::tanh(x))
LUMEN_REAL_1(tanpi, detail::sin_pi(x) / detail::cos_pi(x))
LUMEN_REAL_1(tgamma, std::tgamma(x))
LUMEN_REAL_1(trunc, std::trunc(x))

LUMEN_REAL_2(atan2, std::atan2(x, y))
LUMEN_REAL_2(atan2pi, std::atan2(x, y) / detail::pi_of<decltype(x)>)
LUMEN_REAL_2(copysign, std::copysign(x, y))
LUMEN_REAL_2(fdim, std::fdim(x, y))
LUMEN_REAL_2(fmax, std::fmax(x, y))
LUMEN_LIFT_2_SCALAR(real_vec, fmax)
LUMEN_REAL_2(fmin, std::fmin(x, y))
LUMEN_LIFT_2_SCALAR(real_vec, fmin)
LUMEN_REAL_2(fmod, std::fmod(x, y))
LUMEN_REAL_2(hypot, std::hypot(x, y))
LUMEN_REAL_2(maxmag, detail::of_greater_size(x, y))
LUMEN_REAL_2(minmag, detail::of_lesser_size(x, y))
LUMEN_REAL_2(nextafter, std::nextafter(x, y))
LUMEN_REAL_2(pow, std::pow(x, y))
LUMEN_REAL_2(powr, detail::power_of_positive(x, y))
LUMEN_REAL_2(remainder, std::remainder(x, y))

LUMEN_REAL_3(fma, std::fma(x, y, z))
LUMEN_REAL_3(mad, std::fma(x, y, z))

SYCL_EXTERNAL inline int ilogb(float x) {
  return std::ilogb(x);
}
SYCL_EXTERNAL inline int ilogb(double x) {
  return std::ilogb(x);
}
LUMEN_LIFT_1(real_vec, ilogb)

SYCL_EXTERNAL inline float ldexp(float x, int y) {
  return std::ldexp(x, y);
}
SYCL_EXTERNAL inline double ldexp(double x, int y) {
  return std::ldexp(x, y);
}
LUMEN_LIFT_2_INT(ldexp)
template <typename V, typename A = detail::real_vec<V>>
SYCL_EXTERNAL A ldexp(const V& x, int y) {
  return ldexp(x, detail::vec_like<int, A>(y));
}

SYCL_EXTERNAL inline float pown(float x, int y) {
  return detail::power_of_int(x, y);
}
SYCL_EXTERNAL inline double pown(double x, int y) {
  return detail::power_of_int(x, y);
}
LUMEN_LIFT_2_INT(pown)

SYCL_EXTERNAL inline float rootn(float x, int y) {
  return detail::root(x, y);
}
SYCL_EXTERNAL inline double rootn(double x, int y) {
  return detail::root(x, y);
}
LUMEN_LIFT_2_INT(rootn)

// A quiet NaN whose payload is the low bits of the argument.
SYCL_EXTERNAL inline float nan(std::uint32_t code) {
  return sycl::bit_cast<float>(UINT32_C(0x7FC00000) | (code & UINT32_C(0x003FFFFF)));
}
SYCL_EXTERNAL inline double nan(std::uint64_t code) {
  return sycl::bit_cast<double>(UINT64_C(0x7FF8000000000000) |
                                (code & UINT64_C(0x0007FFFFFFFFFFFF)));
}
template <typename V, typename A = detail::integer_vec<V>,
          typename = std::enable_if_t<std::is_same_v<typename A::element_type, std::uint32_t> ||
                                      std::is_same_v<typename A::element_type, std::uint64_t>>>
SYCL_EXTERNAL auto nan(const V& code) {
  const A bits = code;
  detail::vec_like<decltype(nan(bits[0])), A> result;
  for (int i = 0; i < detail::count_of<A>; ++i) {
    result[i] = nan(bits[i]);
  }
  return result;
}

LUMEN_NAMESPACE_END
