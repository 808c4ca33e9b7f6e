// SPDX-License-Identifier: Apache-2.0
// The second proof of the period, by inversive decimation (Matsumoto and Nishimura, "Mersenne
// Twister", ACM TOMACS 8(1), 1998, section 4.3). It uses the recurrence alone and shares nothing
// with the polynomials.
#pragma once

#include <array>
#include <cstdint>

namespace tarn::mt2203 {

// Candidates that are tried side by side, in plain loops that the compiler makes SIMD code of.
inline constexpr std::size_t decimation_lanes = 16;

// For each lane: the characteristic polynomial of its `a` is irreducible.
std::array<bool, decimation_lanes> irreducible_by_decimation(
    const std::array<std::uint32_t, decimation_lanes>& a);

}  // namespace tarn::mt2203
