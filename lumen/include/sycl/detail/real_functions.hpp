// SPDX-License-Identifier: Apache-2.0
// Scalar functions that the C library lacks, for float and double: multiples of pi, real powers
// with a restricted domain, and roots. Error bounds are stated for each and tested. What the math
// library of CUDA has is taken from there in code for GPUs, with the bounds that its manual gives.
#pragma once

#include <cmath>
#include <limits>
#include <math.h>

#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

template <typename T>
inline constexpr T pi_of = T(3.141592653589793238462643383279502884L);

template <typename T>
inline constexpr T not_a_number = std::numeric_limits<T>::quiet_NaN();

// |x| = quarter / 2 + rest modulo 2, with quarter of 0 to 4 and |rest| <= 1/4, all exact.
template <typename T>
struct half_turns {
  int quarter;
  T rest;
};

template <typename T>
SYCL_EXTERNAL half_turns<T> split_half_turns(T x) {
  const T turn = std::fmod(std::fabs(x), T(2));
  const T quarter = std::rint(2 * turn);
  return {static_cast<int>(quarter), turn - quarter / 2};
}

// sin(pi x), within 2 ulp; exact at integers and half-integers, with the sign of x at integers.
template <typename T>
SYCL_EXTERNAL T sin_pi(T x) {
#if defined(__CUDA_ARCH__)
  return ::sinpi(x);
#else
  if (!std::isfinite(x)) {
    return not_a_number<T>;
  }
  const auto [quarter, rest] = split_half_turns(x);
  if (rest == 0 && quarter % 2 == 0) {
    return std::copysign(T(0), x);
  }
  const T angle = pi_of<T> * rest;
  const T size = quarter % 2 == 0 ? std::sin(angle) : std::cos(angle);
  return (quarter % 4 < 2) == !std::signbit(x) ? size : -size;
#endif
}

// cos(pi x), within 2 ulp; exact at integers and half-integers, where the latter give +0.
template <typename T>
SYCL_EXTERNAL T cos_pi(T x) {
#if defined(__CUDA_ARCH__)
  return ::cospi(x);
#else
  if (!std::isfinite(x)) {
    return not_a_number<T>;
  }
  const auto [quarter, rest] = split_half_turns(x);
  if (rest == 0 && quarter % 2 == 1) {
    return T(0);
  }
  const T angle = pi_of<T> * rest;
  const T size = quarter % 2 == 0 ? std::cos(angle) : std::sin(angle);
  return quarter == 1 || quarter == 2 ? -size : size;
#endif
}

template <typename T>
SYCL_EXTERNAL T power_of_ten(T x) {
#if defined(__CUDA_ARCH__)
  return ::exp10(x);
#else
  return std::pow(T(10), x);
#endif
}

template <typename T>
SYCL_EXTERNAL T reciprocal_root(T x) {
#if defined(__CUDA_ARCH__)
  return ::rsqrt(x);
#else
  return T(1) / std::sqrt(x);
#endif
}

// sin(x), and cos(x) in *cosine.
template <typename T>
SYCL_EXTERNAL T sine_and_cosine(T x, T* cosine) {
#if defined(__CUDA_ARCH__)
  T sine;
  ::sincos(x, &sine, cosine);
  return sine;
#else
  *cosine = std::cos(x);
  return std::sin(x);
#endif
}

// x^y for x >= 0 only; NaN where the limit depends on the road (0^0, inf^0, 1^inf).
template <typename T>
SYCL_EXTERNAL T power_of_positive(T x, T y) {
  const bool no_limit =
      (y == 0 && (x == 0 || std::isinf(x))) || (x == 1 && std::isinf(y)) || std::isnan(y);
  return x >= 0 && !no_limit ? std::pow(std::fabs(x), y) : not_a_number<T>;
}

// x^n. A float cannot hold every int, so that its powers are taken in double.
SYCL_EXTERNAL inline float power_of_int(float x, int n) {
  return static_cast<float>(std::pow(static_cast<double>(x), static_cast<double>(n)));
}
SYCL_EXTERNAL inline double power_of_int(double x, int n) {
  return std::pow(x, static_cast<double>(n));
}

// x^(1/n) for x > 0, within 1 ulp of float and 2 of double. The rounding of 1/n alone would cost
// hundreds of ulp at the ends of the range of double; one Newton step removes that.
SYCL_EXTERNAL inline float root_of_positive(float x, int n) {
  return static_cast<float>(std::pow(static_cast<double>(x), 1.0 / n));
}
SYCL_EXTERNAL inline double root_of_positive(double x, int n) {
  const double root = std::pow(x, 1.0 / n);
  const double back = std::pow(root, n);
  const double step = root * ((back - x) / x) / n;
  return std::isfinite(step) ? root - step : root;
}

// The n-th root with the sign of x for odd n; NaN for n of 0 and for even roots of x < 0.
template <typename T>
SYCL_EXTERNAL T root(T x, int n) {
  const bool odd = n % 2 != 0;
  if (n == 0 || (x < 0 && !odd) || std::isnan(x)) {
    return not_a_number<T>;
  }
  const T size = std::fabs(x);
  const bool is_limit = size == 0 || std::isinf(size);
  const T result =
      is_limit ? std::pow(size, static_cast<T>(n > 0 ? 1 : -1)) : root_of_positive(size, n);
  return odd ? std::copysign(result, x) : result;
}

// The argument of the greater size; of two of one size, fmax or fmin of them.
template <typename T>
SYCL_EXTERNAL T of_greater_size(T x, T y) {
  const T a = std::fabs(x);
  const T b = std::fabs(y);
  return a > b ? x : b > a ? y : std::fmax(x, y);
}
template <typename T>
SYCL_EXTERNAL T of_lesser_size(T x, T y) {
  const T a = std::fabs(x);
  const T b = std::fabs(y);
  return a < b ? x : b < a ? y : std::fmin(x, y);
}

// The sign of gamma(x): that of the side from which x comes at zeros, 1 at the other poles and NaN.
template <typename T>
SYCL_EXTERNAL int sign_of_gamma(T x) {
  const T below = std::floor(x);
  const bool between_poles = x < 0 && below != x;
  const bool negative = between_poles ? std::fmod(below, T(2)) != 0 : x == 0 && std::signbit(x);
  return negative ? -1 : 1;
}

// ln |gamma(x)| and the sign of gamma(x). The plain lgamma of the C library writes a global
// variable, which is a race between work-items; that of CUDA gives no sign at all.
SYCL_EXTERNAL inline float log_gamma(float x, int* sign) {
#if defined(__CUDA_ARCH__)
  *sign = sign_of_gamma(x);
  return ::lgammaf(x);
#else
  return ::lgammaf_r(x, sign);
#endif
}
SYCL_EXTERNAL inline double log_gamma(double x, int* sign) {
#if defined(__CUDA_ARCH__)
  *sign = sign_of_gamma(x);
  return ::lgamma(x);
#else
  return ::lgamma_r(x, sign);
#endif
}
template <typename T>
SYCL_EXTERNAL T log_gamma(T x) {
  int sign = 0;
  return log_gamma(x, &sign);
}

// x - floor(x), kept below 1 where the difference would round up to it; a zero has the sign of x.
template <typename T>
SYCL_EXTERNAL T fraction(T x, T floor) {
  if (x == floor) {
    return std::copysign(T(0), x);
  }
  constexpr T largest = T(1) - std::numeric_limits<T>::epsilon() / 2;
  return std::isnan(x) ? x : std::fmin(x - floor, largest);
}

}  // namespace detail

LUMEN_NAMESPACE_END
