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

RVX_API int _rvxsRngUniform(int method, void* stream, int n, float* r, float a, float b);
RVX_API int _rvxdRngUniform(int method, void* stream, int n, double* r, double a, double b);
RVX_API int _rvxiRngUniform(int method, void* stream, int n, std::int32_t* r, std::int32_t a,
                            std::int32_t b);
RVX_API int _rvxiRngUniformBits(int method, void* stream, int n, std::uint32_t* r);
RVX_API int _rvxiRngUniformBits32(int method, void* stream, int n, std::uint32_t* r);
RVX_API int _rvxiRngUniformBits64(int method, void* stream, int n, std::uint64_t* r);

// Name of the SIMD target ("AVX3", "AVX2", "SSE4", "SSSE3", "SCALAR") that the latest kernel of
// this process ran in, or an empty string before the first. For tests and bug reports.
RVX_API const char* __rvxGetSimdTarget(void);
}
// NOLINTEND(bugprone-reserved-identifier)
