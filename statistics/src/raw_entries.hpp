// SPDX-License-Identifier: Apache-2.0
// The raw entries of the statistics library, which clients find by these names. Counts are 32-bit;
// checks and reports with argument numbers are the client's (binding/), but an entry is safe on
// bad input too: it returns a negative status, writes nothing, and leaves the stream alone.
#pragma once

#include <cstdint>

#include "tarn_rvx.h"

// NOLINTBEGIN(bugprone-reserved-identifier): names that clients resolve.
extern "C" {
RVX_API int __rvxNewStreamEx(void** stream, int code, int n, const std::uint32_t* params);
RVX_API int __rvxDeleteStream(void** stream);
RVX_API int __rvxCopyStream(void** out, void* in);
RVX_API int __rvxLeapfrogStream(void* stream, int idx, int stride);
RVX_API int __rvxSkipAheadStream(void* stream, std::int64_t count);
RVX_API int __rvxSkipAheadStreamEx(void* stream, int n, const std::uint64_t* words);
RVX_API int __rvxGetStreamSize(void* stream);
RVX_API int __rvxSaveStreamF(void* stream, const char* name, int length);
RVX_API int __rvxLoadStreamF(void** stream, const char* name, int length);
RVX_API int __rvxSaveStreamM(void* stream, std::uint8_t* mem);
RVX_API int __rvxLoadStreamM(void** stream, const std::uint8_t* mem);

#define TARN_UNWRAP(...) __VA_ARGS__
#define TARN_ROUTINE(name, value, methods, width, parameters, arguments, check) \
  RVX_API int _rvx##name(int method, void* stream, int n, value* r TARN_UNWRAP parameters);
#include "statistics/common/routines.def"
RVX_API int _rvxiRngPoissonV(int method, void* stream, int n, std::int32_t* r,
                             const double* lambda);

// Name of the SIMD target ("AVX3_DL", "AVX3", "AVX2", "SSE4", "SSSE3", "SCALAR") that the latest
// kernel of this process ran in, or an empty string before the first. For tests and bug reports.
RVX_API const char* __rvxGetSimdTarget(void);
}
// NOLINTEND(bugprone-reserved-identifier)
