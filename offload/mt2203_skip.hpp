// SPDX-License-Identifier: Apache-2.0
// Skipping in streams of mt2203, for which the statistics library has no service.
#pragma once

#include <cstdint>
#include <tarn_rvx.h>

namespace kestrel::tarn::rng::detail::openmp {

/// Moves the record of an mt2203 stream past `words` words, as drawing them would, in time
/// proportional to their number; counts below 1 do nothing.
void skip_mt2203(rvx_stream stream, std::int64_t words);

}  // namespace kestrel::tarn::rng::detail::openmp
