// SPDX-License-Identifier: Apache-2.0
// Choice of the SIMD target. Kernels are compiled once per target of Highway and stand in tables
// made by HWY_EXPORT; this library picks the row by a choice of its own, so that it neither reads
// nor disturbs the choice of other users of Highway in the process.
#pragma once

#include <cstddef>

namespace tarn::statistics {

// The row of Highway's dispatch tables to call: the best target of this processor, or the one
// that the environment variable TARN_SIMD_TARGET names. Decided once per process.
std::size_t simd_row();

// Kernels tell the name of the target they were compiled for.
void note_simd_target(const char* name);

// The latest name told, or an empty string.
const char* latest_simd_target();

}  // namespace tarn::statistics

// Calls the chosen target's variant of a function given to HWY_EXPORT in this source.
#define TARN_SIMD_CALL(function) (HWY_DISPATCH_TABLE(function)[::tarn::statistics::simd_row()])
