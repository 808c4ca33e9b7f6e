// SPDX-License-Identifier: Apache-2.0
// Elementary functions on whole vectors, the same bits on every SIMD target. For sources that are
// compiled once per target: include after <hwy/highway.h>, inside no namespace.
#include "simd/sleef.hpp"

#if defined(TARN_VECTOR_MATH_INL_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_VECTOR_MATH_INL_HPP
#undef TARN_VECTOR_MATH_INL_HPP
#else
#define TARN_VECTOR_MATH_INL_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

using float_vector = hwy::HWY_NAMESPACE::Vec<hwy::HWY_NAMESPACE::ScalableTag<float>>;
using double_vector = hwy::HWY_NAMESPACE::Vec<hwy::HWY_NAMESPACE::ScalableTag<double>>;

#if HWY_TARGET == HWY_AVX3
#define TARN_SLEEF(name, accuracy) \
  Sleef_cinz_##name##f16_##accuracy##avx512fnofma, Sleef_cinz_##name##d8_##accuracy##avx512fnofma
#elif HWY_TARGET == HWY_AVX2
#define TARN_SLEEF(name, accuracy) \
  Sleef_cinz_##name##f8_##accuracy##avx, Sleef_cinz_##name##d4_##accuracy##avx
#elif HWY_TARGET == HWY_SSE4
#define TARN_SLEEF(name, accuracy) \
  Sleef_cinz_##name##f4_##accuracy##sse4, Sleef_cinz_##name##d2_##accuracy##sse4
#elif HWY_TARGET == HWY_SSSE3
#define TARN_SLEEF(name, accuracy) \
  Sleef_cinz_##name##f4_##accuracy##sse2, Sleef_cinz_##name##d2_##accuracy##sse2
#elif HWY_TARGET == HWY_SCALAR
#define TARN_SLEEF(name, accuracy) \
  Sleef_cinz_##name##f1_##accuracy##purec, Sleef_cinz_##name##d1_##accuracy##purec
#else
#error "no vector functions for this target"
#endif

#define TARN_VECTOR_FUNCTION(function, of_float, of_double) \
  HWY_INLINE float_vector function(float_vector x) {        \
    return float_vector{of_float(x.raw)};                   \
  }                                                         \
  HWY_INLINE double_vector function(double_vector x) {      \
    return double_vector{of_double(x.raw)};                 \
  }
#define TARN_VECTOR_FUNCTION_OF(function, ...) TARN_VECTOR_FUNCTION(function, __VA_ARGS__)
#define TARN_VECTOR_FUNCTION_OF_TWO(function, of_float, of_double)      \
  HWY_INLINE float_vector function(float_vector x, float_vector y) {    \
    return float_vector{of_float(x.raw, y.raw)};                        \
  }                                                                     \
  HWY_INLINE double_vector function(double_vector x, double_vector y) { \
    return double_vector{of_double(x.raw, y.raw)};                      \
  }
#define TARN_VECTOR_FUNCTION_OF_TWO_OF(function, ...) \
  TARN_VECTOR_FUNCTION_OF_TWO(function, __VA_ARGS__)

// Natural logarithm: within 3.5 units in the last place, and within 1.0.
TARN_VECTOR_FUNCTION_OF(vector_log, TARN_SLEEF(log, u35))
TARN_VECTOR_FUNCTION_OF(vector_log_close, TARN_SLEEF(log, u10))
TARN_VECTOR_FUNCTION_OF(vector_exp, TARN_SLEEF(exp, u10))
// Arguments in radians.
TARN_VECTOR_FUNCTION_OF(vector_sin, TARN_SLEEF(sin, u35))
TARN_VECTOR_FUNCTION_OF(vector_cos, TARN_SLEEF(cos, u35))
TARN_VECTOR_FUNCTION_OF(vector_tan, TARN_SLEEF(tan, u35))
TARN_VECTOR_FUNCTION_OF_TWO_OF(vector_pow, TARN_SLEEF(pow, u10))

#undef TARN_SLEEF
#undef TARN_VECTOR_FUNCTION
#undef TARN_VECTOR_FUNCTION_OF
#undef TARN_VECTOR_FUNCTION_OF_TWO
#undef TARN_VECTOR_FUNCTION_OF_TWO_OF

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif  // per target
