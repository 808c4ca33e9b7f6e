// SPDX-License-Identifier: Apache-2.0
// Choice of the SIMD target. Kernels are compiled once per target of Highway and stand in tables
// made by HWY_EXPORT; this library picks the row by a choice of its own, so that it neither reads
// nor disturbs the choice of other users of Highway in the process.
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics {

// The row to call of a dispatch table that was compiled for `targets` (bits of Highway): the best
// one that this processor runs, or the best one not above the target that the environment variable
// TARN_SIMD_TARGET names. The limit is decided once per process.
std::size_t simd_row(std::int64_t targets);

// Kernels tell the name of the target they were compiled for.
void note_simd_target(const char* name);

// The latest name told, or an empty string.
const char* latest_simd_target();

}  // namespace tarn::statistics

// Calls the chosen target's variant of a function given to HWY_EXPORT in this source. The row is
// found at the first call of each place.
#define TARN_SIMD_CALL(function)                                              \
  (HWY_DISPATCH_TABLE(function)[([] {                                         \
    static const std::size_t row = ::tarn::statistics::simd_row(HWY_TARGETS); \
    return row;                                                               \
  }())])
