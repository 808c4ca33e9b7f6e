// SPDX-License-Identifier: Apache-2.0
// The functions of SLEEF (Shibata, Petrogalli: SLEEF: A Portable Vectorized Library of C Standard
// Mathematical Functions, IEEE Trans. Parallel and Distributed Systems 31, 2020) that this library
// calls: the deterministic ones without fused multiply-adds ("cinz"), which give the same bits for
// every vector length. Declared here since SLEEF's own header declares only what the compiler's
// command line allows, and each source here is compiled for several instruction sets.
//
// u10: error below 1.0 units in the last place; u35: below 3.5, at less than half the time.
#pragma once

#include <immintrin.h>

#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wpsabi"  // vectors are passed only where the target has them

// function(accuracy suffix): all vector forms of `name`, of one argument.
#define TARN_SLEEF_UNARY(name, accuracy)                          \
  float Sleef_cinz_##name##f1_##accuracy##purec(float);           \
  double Sleef_cinz_##name##d1_##accuracy##purec(double);         \
  __m128 Sleef_cinz_##name##f4_##accuracy##sse2(__m128);          \
  __m128d Sleef_cinz_##name##d2_##accuracy##sse2(__m128d);        \
  __m128 Sleef_cinz_##name##f4_##accuracy##sse4(__m128);          \
  __m128d Sleef_cinz_##name##d2_##accuracy##sse4(__m128d);        \
  __m256 Sleef_cinz_##name##f8_##accuracy##avx(__m256);           \
  __m256d Sleef_cinz_##name##d4_##accuracy##avx(__m256d);         \
  __m512 Sleef_cinz_##name##f16_##accuracy##avx512fnofma(__m512); \
  __m512d Sleef_cinz_##name##d8_##accuracy##avx512fnofma(__m512d);
#define TARN_SLEEF_BINARY(name, accuracy)                                 \
  float Sleef_cinz_##name##f1_##accuracy##purec(float, float);            \
  double Sleef_cinz_##name##d1_##accuracy##purec(double, double);         \
  __m128 Sleef_cinz_##name##f4_##accuracy##sse2(__m128, __m128);          \
  __m128d Sleef_cinz_##name##d2_##accuracy##sse2(__m128d, __m128d);       \
  __m128 Sleef_cinz_##name##f4_##accuracy##sse4(__m128, __m128);          \
  __m128d Sleef_cinz_##name##d2_##accuracy##sse4(__m128d, __m128d);       \
  __m256 Sleef_cinz_##name##f8_##accuracy##avx(__m256, __m256);           \
  __m256d Sleef_cinz_##name##d4_##accuracy##avx(__m256d, __m256d);        \
  __m512 Sleef_cinz_##name##f16_##accuracy##avx512fnofma(__m512, __m512); \
  __m512d Sleef_cinz_##name##d8_##accuracy##avx512fnofma(__m512d, __m512d);

extern "C" {
TARN_SLEEF_UNARY(log, u35)
TARN_SLEEF_UNARY(log, u10)
TARN_SLEEF_UNARY(exp, u10)
TARN_SLEEF_UNARY(sin, u35)
TARN_SLEEF_UNARY(cos, u35)
TARN_SLEEF_UNARY(tan, u35)
TARN_SLEEF_BINARY(pow, u10)
}

#undef TARN_SLEEF_UNARY
#undef TARN_SLEEF_BINARY

#pragma GCC diagnostic pop
