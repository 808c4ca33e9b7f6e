/* SPDX-License-Identifier: Apache-2.0 */
/** \file
 * The host statistics library (libtarn_vlx.so): streams of random words and routines that turn
 * them into variates, for C and C++ programs without any SYCL.
 *
 * A stream belongs to one thread at a time. Every function returns 0 on success and a negative
 * status otherwise; a bad argument is also reported through the core library's argument report
 * (by default one line on standard error), and then nothing is written and the stream stays
 * where it was.
 *
 * Generation: for one seed the values never depend on the processor, on its SIMD width, on the
 * number of threads, or on how a sequence is cut into calls.
 *
 * Environment: TARN_NUM_THREADS, the most threads that one call may use (large calls share their
 * work out); TARN_SIMD_TARGET, the instruction set of the kernels by its Highway name (AVX3_DL,
 * AVX3, AVX2, SSE4, SSSE3, SCALAR; default: best), for tests and comparisons.
 */
#ifndef TARN_RVX_H
#define TARN_RVX_H

#include <stdint.h>

/* Exported, except where a library links the objects for its own use (TARN_RVX_HIDDEN=1). */
/** \cond */
#if defined(TARN_RVX_HIDDEN) && TARN_RVX_HIDDEN
#define RVX_API
#else
#define RVX_API __attribute__((visibility("default")))
#endif
/** \endcond */

#ifdef __cplusplus
extern "C" {
#endif

/** A stream: an opaque record. The 32-bit engine code stands at byte 0, a mark of value 1 at
 * byte 4, the engine's state from byte 16 on. */
typedef void* rvx_stream;

/** \defgroup rvx_engines Engine codes
 * The engine's number shifted left by 20. The manual has a page for each engine.
 * \{ */
#define RVX_BRNG_MCG31 0x100000          /**< multiplicative congruential, modulus 2^31 - 1 */
#define RVX_BRNG_R250 0x200000           /**< feedback shift register, lags 103 and 250 */
#define RVX_BRNG_MRG32K3A 0x300000       /**< combined multiple recursive */
#define RVX_BRNG_MCG59 0x400000          /**< multiplicative congruential, modulus 2^59 */
#define RVX_BRNG_WH 0x500000             /**< Wichmann-Hill, a set: + 0 to 272 */
#define RVX_BRNG_SOBOL 0x600000          /**< quasi-random, up to 3667 dimensions */
#define RVX_BRNG_NIEDERR 0x700000        /**< quasi-random, up to 4720 dimensions */
#define RVX_BRNG_MT19937 0x800000        /**< Mersenne twister */
#define RVX_BRNG_MT2203 0x900000         /**< small Mersenne twisters, a set: + 0 to 6023 */
#define RVX_BRNG_SFMT19937 0xD00000      /**< SIMD-oriented fast Mersenne twister */
#define RVX_BRNG_NONDETERM 0xE00000      /**< the processor's or the operating system's source */
#define RVX_BRNG_ARS5 0xF00000           /**< counter-based, five AES rounds */
#define RVX_BRNG_PHILOX4X32X10 0x1000000 /**< counter-based, ten Philox rounds */
/** \} */

/** \defgroup rvx_methods Method codes
 * The manual's page of each distribution tells what they mean. Routines without a code of their own
 * here take RVX_RNG_METHOD_STANDARD.
 * \{ */
#define RVX_RNG_METHOD_STANDARD 0 /**< the first or only method of a routine */
/** Added to a code: keeps results from rounding beyond the ends of the law's support. */
#define RVX_RNG_METHOD_ACCURACY_FLAG 0x40000000
#define RVX_RNG_METHOD_UNIFORM_STD 0                   /**< rounding may deliver b */
#define RVX_RNG_METHOD_UNIFORM_STD_ACCURATE 0x40000000 /**< inside [a, b] */
#define RVX_RNG_METHOD_GAUSSIAN_BOXMULLER 0            /**< two words, one result */
#define RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2 1           /**< two words, two results */
#define RVX_RNG_METHOD_GAUSSIAN_ICDF 2                 /**< inversion: one word, one result */
#define RVX_RNG_METHOD_LOGNORMAL_BOXMULLER2 0          /**< two words, two results */
#define RVX_RNG_METHOD_LOGNORMAL_ICDF 1                /**< inversion: one word, one result */
#define RVX_RNG_METHOD_POISSON_PTPE 0                  /**< rejection, exact */
#define RVX_RNG_METHOD_POISSON_GAUSSIAN_ICDF 1 /**< one word, one result; an approximation */
/** \} */

/** \defgroup rvx_statuses Statuses
 * Other negative values name a bad argument: -k is the k-th argument.
 * \{ */
#define RVX_STATUS_OK 0             /**< done */
#define RVX_STATUS_NULL_STREAM (-5) /**< a null handle */
/** No engine of that code, or seed words that no stream can be made of. */
#define RVX_STATUS_BAD_CODE (-1000)
#define RVX_STATUS_NO_MEMORY (-1001) /**< memory is exhausted */
/** The engine has no such service. */
#define RVX_STATUS_UNSUPPORTED (-1002)
/** The library lacks the entry, and an exit hook kept the process alive. */
#define RVX_STATUS_NO_ENTRY (-1003)
/** Neither the processor nor the operating system gives random words. */
#define RVX_STATUS_NO_SOURCE (-1004)
/** The call would go past the end of a finite sequence (2^32 - 1 points of a quasi-random one). */
#define RVX_STATUS_END_OF_SEQUENCE (-1005)
/** Not a stream, one that was deleted, or a state that its engine cannot be in. */
#define RVX_STATUS_BAD_MARK (-1006)
#define RVX_STATUS_FILE_OPEN (-1100)  /**< the file cannot be opened */
#define RVX_STATUS_FILE_READ (-1101)  /**< the file cannot be read */
#define RVX_STATUS_FILE_WRITE (-1102) /**< the file cannot be written */
/** A damaged or foreign image: mark, version, length, check sum or an impossible field. */
#define RVX_STATUS_BAD_IMAGE (-1103)
/** \} */

/** \defgroup rvx_streams Streams
 * Besides the statuses named, every function that takes a stream gives -5 for a null one and -1006
 * for one without its mark.
 * \{ */

/** A new stream from a seed. A seed above 0x7FFFFFFF travels as two 32-bit words, low word first,
 * otherwise as one: engines of 32-bit seeds then take their array rule.
 * \param stream  receives the handle; not null (-5)
 * \param code    an engine code (-1000 for others)
 * \param seed    up to 64 bits; a count of dimensions for the quasi-random engines
 * \return        0; also -1000 for a seed that the engine refuses, -1001, -1004 */
RVX_API int rvxNewStream(rvx_stream* stream, int64_t code, uint64_t seed);

/** A new stream from seed words; how many of them an engine uses, and how, its manual page tells:
 * missing ones have the engine's default, further ones are ignored. Quasi-random engines:
 * {dimensions}; or {dimensions, 1, 4} and 32 direction words for each dimension
 * (RVX_BRNG_SOBOL), {count, 1, 1} and count irreducible polynomials, bit i the coefficient of t^i
 * (RVX_BRNG_NIEDERR).
 * \param stream  as above
 * \param code    as above
 * \param n       count of words, 0 to 2^31 - 1 (-3)
 * \param params  n words; may be null if n is 0 (-4)
 * \return        as above */
RVX_API int rvxNewStreamEx(rvx_stream* stream, int64_t code, int64_t n, const uint32_t* params);

/** Frees the stream and clears the handle. */
RVX_API int rvxDeleteStream(rvx_stream* stream);

/** Deep copy of `in` into a new stream, which goes on by itself.
 * \param out  receives the handle; not null (-5)
 * \param in   a stream
 * \return     0; -1001 without memory */
RVX_API int rvxCopyStream(rvx_stream* out, rvx_stream in);

/** Moves the stream forward.
 * \param stream  not of RVX_BRNG_R250, _MT2203 and _NONDETERM (-1002)
 * \param count   words; the 64 bits are read as an unsigned number
 * \return        0; -1005 past the end; -1001 without memory for the long jump of a Mersenne
 *                twister. On failure the stream has not moved */
RVX_API int rvxSkipAheadStream(rvx_stream stream, int64_t count);

/** Moves forward by a long count of words, modulo the period.
 * \param stream  of RVX_BRNG_MRG32K3A, _ARS5 or _PHILOX4X32X10 (-1002 for others)
 * \param n       0 to 2^31 - 1 (-2)
 * \param words   the count as n 64-bit digits, least significant first (-3)
 * \return        0 or the statuses named */
RVX_API int rvxSkipAheadStreamEx(rvx_stream stream, int64_t n, const uint64_t* words);

/** Leaves words idx, idx + stride, idx + 2 stride, ... of what the stream would have given.
 * \param stream  of RVX_BRNG_MCG31, _MCG59 or _WH (-1002 for others)
 * \param idx     0 to stride - 1 (-2)
 * \param stride  1 to 2^31 - 1 (-3)
 * \return        0 or the statuses named */
RVX_API int rvxLeapfrogStream(rvx_stream stream, int64_t idx, int64_t stride);

/** Bytes of the saved image, positive. */
RVX_API int rvxGetStreamSize(rvx_stream stream);

/** Writes the image to memory of rvxGetStreamSize bytes (-2 if null). */
RVX_API int rvxSaveStreamM(rvx_stream stream, uint8_t* mem);

/** A new stream from the image in memory (-2 if null), or none: -1103 for what is no whole image,
 * -1001. */
RVX_API int rvxLoadStreamM(rvx_stream* stream, const uint8_t* mem);

/** Writes the image to a file: beside it at first, then renamed, so that an older image survives an
 * interrupted save and a full disk.
 * \param stream  a stream
 * \param name    of the file; not null (-2)
 * \param length  bytes of the name, or -1 for a NUL-terminated one (-3)
 * \return        0; -1100, -1102 when the file cannot be opened or written; -1001 */
RVX_API int rvxSaveStreamF(rvx_stream stream, const char* name, int length);

/** A new stream from the image in a file, or none.
 * \param stream  receives the handle; not null (-5)
 * \param name    of the file; not null (-2)
 * \param length  bytes of the name, or -1 for a NUL-terminated one (-3)
 * \return        0; -1100, -1101 when the file cannot be opened or read; -1103; -1001 */
RVX_API int rvxLoadStreamF(rvx_stream* stream, const char* name, int length);

/** \} */

/** \defgroup rvx_routines Routines
 * Common head:
 * - method: a method code, not negative (-1)
 * - stream: (-5, -1006)
 * - n: count of results, 0 or more (-3); 0 does nothing
 * - r: n results (-4)
 *
 * then the distribution's parameters. A call of more than 2^31 - 1 results goes in pieces: when one
 * fails, those before it stand and the stream is behind them. Also -1002 where the engine does not
 * offer the routine, -1005 past the end of a finite sequence, -1004 when an outer source fails,
 * -1001.
 *
 * Parameters of real distributions are finite, scales and shapes positive; each refusal gives -k
 * for the k-th argument. Formulas, words consumed, sources and accuracy: the manual's page of each.
 * \{ */

/** Uniform on [a, b), a < b, with b - a and a + b finite in the type of the results (-5): the
 * word-to-real rule of the engine, one word for one result. Rounding may deliver b itself; with the
 * accuracy flag no result lies outside [a, b]. */
RVX_API int rvxsRngUniform(int64_t method, rvx_stream stream, int64_t n, float* r, float a,
                           float b);
/** The same in double precision. */
RVX_API int rvxdRngUniform(int64_t method, rvx_stream stream, int64_t n, double* r, double a,
                           double b);

/** Integers of [a, b), a < b (-5): floor of a float uniform. Bounds beyond 2^24 are rounded, which
 * leaves gaps and may leave [a, b); rounding may deliver b itself in any case. */
RVX_API int rvxiRngUniform(int64_t method, rvx_stream stream, int64_t n, int32_t* r, int32_t a,
                           int32_t b);

/** The engine's raw words. A word of RVX_BRNG_MCG59 has 59 bits and takes two numbers of r, low
 * part first: r then holds 2 n numbers. */
RVX_API int rvxiRngUniformBits(int64_t method, rvx_stream stream, int64_t n, uint32_t* r);

/** 32 equidistributed bits for one result. -1002 for RVX_BRNG_MCG31, _R250, _MRG32K3A, _WH, _SOBOL
 * and _NIEDERR, whose words are no such bits. */
RVX_API int rvxiRngUniformBits32(int64_t method, rvx_stream stream, int64_t n, uint32_t* r);

/** The same with 64 bits: two words for each result, the first one in the low half. */
RVX_API int rvxiRngUniformBits64(int64_t method, rvx_stream stream, int64_t n, uint64_t* r);

/** Normal: mean, stddev (-6). Methods RVX_RNG_METHOD_GAUSSIAN_*. */
RVX_API int rvxsRngGaussian(int64_t method, rvx_stream stream, int64_t n, float* r, float mean,
                            float stddev);
/** The same in double precision. */
RVX_API int rvxdRngGaussian(int64_t method, rvx_stream stream, int64_t n, double* r, double mean,
                            double stddev);

/** n vectors of `dimension` (-5) correlated normals, mean + T z with the lower triangular factor T
 * of the covariance: layout (-6) 0 full, row by row; 1 packed, column by column from the diagonal
 * on; 2 diagonal. The entries of mean (-7) and of matrix (-8), but for those above the diagonal in
 * the full layout, are finite. r holds n * dimension numbers. */
RVX_API int rvxsRngGaussianMV(int64_t method, rvx_stream stream, int64_t n, float* r,
                              int32_t dimension, int32_t layout, const float* mean,
                              const float* matrix);
/** The same in double precision. */
RVX_API int rvxdRngGaussianMV(int64_t method, rvx_stream stream, int64_t n, double* r,
                              int32_t dimension, int32_t layout, const double* mean,
                              const double* matrix);

/** displ + scale * exp(normal of mean m and deviation s): s (-6), scale (-8). */
RVX_API int rvxsRngLognormal(int64_t method, rvx_stream stream, int64_t n, float* r, float m,
                             float s, float displ, float scale);
/** The same in double precision. */
RVX_API int rvxdRngLognormal(int64_t method, rvx_stream stream, int64_t n, double* r, double m,
                             double s, double displ, double scale);

/** a + beta * standard exponential: beta (-6). */
RVX_API int rvxsRngExponential(int64_t method, rvx_stream stream, int64_t n, float* r, float a,
                               float beta);
/** The same in double precision. */
RVX_API int rvxdRngExponential(int64_t method, rvx_stream stream, int64_t n, double* r, double a,
                               double beta);

/** a + beta * gamma of shape alpha: alpha (-5), beta (-7). */
RVX_API int rvxsRngGamma(int64_t method, rvx_stream stream, int64_t n, float* r, float alpha,
                         float a, float beta);
/** The same in double precision. */
RVX_API int rvxdRngGamma(int64_t method, rvx_stream stream, int64_t n, double* r, double alpha,
                         double a, double beta);

/** a + b * beta of shapes p (-5) and q (-6): b (-8). */
RVX_API int rvxsRngBeta(int64_t method, rvx_stream stream, int64_t n, float* r, float p, float q,
                        float a, float b);
/** The same in double precision. */
RVX_API int rvxdRngBeta(int64_t method, rvx_stream stream, int64_t n, double* r, double p, double q,
                        double a, double b);

/** Chi-square of `degrees` of freedom, 1 or more (-5). */
RVX_API int rvxsRngChiSquare(int64_t method, rvx_stream stream, int64_t n, float* r,
                             int32_t degrees);
/** The same in double precision. */
RVX_API int rvxdRngChiSquare(int64_t method, rvx_stream stream, int64_t n, double* r,
                             int32_t degrees);

/** a + beta * (standard exponential)^(1 / alpha): alpha (-5), beta (-7). */
RVX_API int rvxsRngWeibull(int64_t method, rvx_stream stream, int64_t n, float* r, float alpha,
                           float a, float beta);
/** The same in double precision. */
RVX_API int rvxdRngWeibull(int64_t method, rvx_stream stream, int64_t n, double* r, double alpha,
                           double a, double beta);

/** a + b * sqrt(standard exponential): b (-6). */
RVX_API int rvxsRngRayleigh(int64_t method, rvx_stream stream, int64_t n, float* r, float a,
                            float b);
/** The same in double precision. */
RVX_API int rvxdRngRayleigh(int64_t method, rvx_stream stream, int64_t n, double* r, double a,
                            double b);

/** a + b * ln(standard exponential): b (-6). */
RVX_API int rvxsRngGumbel(int64_t method, rvx_stream stream, int64_t n, float* r, float a, float b);
/** The same in double precision. */
RVX_API int rvxdRngGumbel(int64_t method, rvx_stream stream, int64_t n, double* r, double a,
                          double b);

/** Density exp(-|x - a| / b) / (2 b): b (-6). */
RVX_API int rvxsRngLaplace(int64_t method, rvx_stream stream, int64_t n, float* r, float a,
                           float b);
/** The same in double precision. */
RVX_API int rvxdRngLaplace(int64_t method, rvx_stream stream, int64_t n, double* r, double a,
                           double b);

/** a + b * tan(uniform angle): b (-6). */
RVX_API int rvxsRngCauchy(int64_t method, rvx_stream stream, int64_t n, float* r, float a, float b);
/** The same in double precision. */
RVX_API int rvxdRngCauchy(int64_t method, rvx_stream stream, int64_t n, double* r, double a,
                          double b);

/** 1 with probability p, 0 <= p <= 1 (-5). */
RVX_API int rvxiRngBernoulli(int64_t method, rvx_stream stream, int64_t n, int32_t* r, double p);

/** Failures before the first success, 0 < p <= 1 (-5). */
RVX_API int rvxiRngGeometric(int64_t method, rvx_stream stream, int64_t n, int32_t* r, double p);

/** Successes in ntrial >= 1 (-5) trials, 0 <= p <= 1 (-6). */
RVX_API int rvxiRngBinomial(int64_t method, rvx_stream stream, int64_t n, int32_t* r,
                            int32_t ntrial, double p);

/** Marked ones among s (-6) drawn from l (-5) of which m (-7) are marked. */
RVX_API int rvxiRngHypergeometric(int64_t method, rvx_stream stream, int64_t n, int32_t* r,
                                  int32_t l, int32_t s, int32_t m);

/** Failures before success number a > 0 (-5), a real number, 0 < p <= 1 (-6). */
RVX_API int rvxiRngNegbinomial(int64_t method, rvx_stream stream, int64_t n, int32_t* r, double a,
                               double p);

/** n rows of `categories` >= 1 (-6) counts of ntrial >= 0 (-5) trials of probabilities p (-7),
 * which sum to 1. r holds n * categories numbers. */
RVX_API int rvxiRngMultinomial(int64_t method, rvx_stream stream, int64_t n, int32_t* r,
                               int32_t ntrial, int32_t categories, const double* p);

/** Poisson of rate lambda > 0 (-5). Methods RVX_RNG_METHOD_POISSON_*. */
RVX_API int rvxiRngPoisson(int64_t method, rvx_stream stream, int64_t n, int32_t* r, double lambda);

/** Poisson with a rate of its own for each result: n of them (-5). */
RVX_API int rvxiRngPoissonV(int64_t method, rvx_stream stream, int64_t n, int32_t* r,
                            const double* lambda);

/** \} */

#ifdef __cplusplus
}
#endif

#endif
