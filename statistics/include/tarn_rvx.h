/* SPDX-License-Identifier: Apache-2.0
 *
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
 * work out); TARN_SIMD_TARGET, the instruction set of the kernels by its Highway name (AVX3, AVX2,
 * SSE4, SSSE3, SCALAR; default: best), for tests and comparisons.
 */
#ifndef TARN_RVX_H
#define TARN_RVX_H

#include <stdint.h>

/* Exported, except where a library links the objects for its own use (TARN_RVX_HIDDEN=1). */
#if defined(TARN_RVX_HIDDEN) && TARN_RVX_HIDDEN
#define RVX_API
#else
#define RVX_API __attribute__((visibility("default")))
#endif

#ifdef __cplusplus
extern "C" {
#endif

/* A stream: an opaque record. The 32-bit engine code stands at byte 0, a mark of value 1 at
 * byte 4, the engine's state from byte 16 on. */
typedef void* rvx_stream;

/* Engine codes: the engine's number shifted left by 20. */
#define RVX_BRNG_PHILOX4X32X10 0x1000000

/* Method codes. The accuracy flag keeps results of a uniform inside [a, b]. */
#define RVX_RNG_METHOD_STANDARD 0
#define RVX_RNG_METHOD_ACCURACY_FLAG 0x40000000
#define RVX_RNG_METHOD_UNIFORM_STD 0
#define RVX_RNG_METHOD_UNIFORM_STD_ACCURATE 0x40000000

/* Statuses. Other negative values name a bad argument: -k is the k-th argument. */
#define RVX_STATUS_OK 0
#define RVX_STATUS_NULL_STREAM (-5)
/* No engine of that code, or bad seed words. */
#define RVX_STATUS_BAD_CODE (-1000)
#define RVX_STATUS_NO_MEMORY (-1001)
/* The engine has no such service. */
#define RVX_STATUS_UNSUPPORTED (-1002)
/* The library lacks the entry, and an exit hook kept the process alive. */
#define RVX_STATUS_NO_ENTRY (-1003)
/* Not a stream, one that was deleted, or a state that its engine cannot be in. */
#define RVX_STATUS_BAD_MARK (-1006)
#define RVX_STATUS_FILE_OPEN (-1100)
#define RVX_STATUS_FILE_READ (-1101)
#define RVX_STATUS_FILE_WRITE (-1102)
/* A damaged or foreign image: mark, version, length, checksum or an impossible field. */
#define RVX_STATUS_BAD_IMAGE (-1103)

/* New stream from a seed of up to 64 bits. A seed above 0x7FFFFFFF travels as two 32-bit words,
 * low word first, otherwise as one. `code` outside [0, 2^31) or unknown gives -1000. */
RVX_API int rvxNewStream(rvx_stream* stream, int64_t code, uint64_t seed);

/* New stream from `n` 32-bit seed words; how many words an engine uses is the engine's affair:
 * missing ones have the engine's default, further ones are ignored. */
RVX_API int rvxNewStreamEx(rvx_stream* stream, int64_t code, int64_t n, const uint32_t* params);

/* Frees the stream and clears the handle. */
RVX_API int rvxDeleteStream(rvx_stream* stream);

/* Deep copy into a new stream. */
RVX_API int rvxCopyStream(rvx_stream* out, rvx_stream in);

/* Moves the stream forward by `count` words. The 64 bits are read as an unsigned number. */
RVX_API int rvxSkipAheadStream(rvx_stream stream, int64_t count);

/* Moves forward by the number whose `n` 64-bit digits are `words`, least significant first. */
RVX_API int rvxSkipAheadStreamEx(rvx_stream stream, int64_t n, const uint64_t* words);

/* Leaves every `stride`-th word, beginning with word `idx` (engines that can). */
RVX_API int rvxLeapfrogStream(rvx_stream stream, int64_t idx, int64_t stride);

/* Bytes of the saved image, positive; a negative status on failure. */
RVX_API int rvxGetStreamSize(rvx_stream stream);

/* Image in memory of rvxGetStreamSize bytes. Loading makes a new stream. */
RVX_API int rvxSaveStreamM(rvx_stream stream, uint8_t* mem);
RVX_API int rvxLoadStreamM(rvx_stream* stream, const uint8_t* mem);

/* Image in a file. `length` is the length of the name, or -1 for a NUL-terminated one. A save
 * writes beside the file and renames, so that an older image survives an interrupted save. */
RVX_API int rvxSaveStreamF(rvx_stream stream, const char* name, int length);
RVX_API int rvxLoadStreamF(rvx_stream* stream, const char* name, int length);

/* Generation. Common head: method code, stream, number of results (0 or more), results; then
 * the distribution's parameters. */

/* Uniform on [a, b), a < b: the word-to-real rule of the engine, one word for one result. The
 * values b - a and a + b are taken in the type of the results and must be finite. Rounding may
 * deliver b itself; with the accuracy flag no result lies outside [a, b]. */
RVX_API int rvxsRngUniform(int64_t method, rvx_stream stream, int64_t n, float* r, float a,
                           float b);
RVX_API int rvxdRngUniform(int64_t method, rvx_stream stream, int64_t n, double* r, double a,
                           double b);
/* Integers of [a, b): floor of a float uniform, so a range wider than 2^24 has gaps. */
RVX_API int rvxiRngUniform(int64_t method, rvx_stream stream, int64_t n, int32_t* r, int32_t a,
                           int32_t b);
/* The engine's raw words. */
RVX_API int rvxiRngUniformBits(int64_t method, rvx_stream stream, int64_t n, uint32_t* r);
/* 32 equidistributed bits for one result. */
RVX_API int rvxiRngUniformBits32(int64_t method, rvx_stream stream, int64_t n, uint32_t* r);
/* 64 equidistributed bits for one result: two words, the first one in the low half. */
RVX_API int rvxiRngUniformBits64(int64_t method, rvx_stream stream, int64_t n, uint64_t* r);

#ifdef __cplusplus
}
#endif

#endif
