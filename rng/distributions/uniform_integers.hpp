// SPDX-License-Identifier: Apache-2.0
// Integers of [a, b) on the host road: double uniforms truncated towards zero, for the cases that
// the statistics library's integer routine does not cover.
#pragma once

#include <cstdint>
#include <tarn_rvx.h>

namespace kestrel::tarn::rng::detail {

/// Draws `n` values into `r`, one word each, in the order of the output. Returns the status of the
/// routine; on a bad argument it has reported and `r` is unchanged. Integer is std::int32_t or
/// std::uint32_t.
template <typename Integer>
int uniform_integers(rvx_stream stream, std::int64_t n, Integer* r, Integer a, Integer b);

}  // namespace kestrel::tarn::rng::detail
