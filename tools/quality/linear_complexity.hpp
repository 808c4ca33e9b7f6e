// SPDX-License-Identifier: Apache-2.0
// The linear complexity of a sequence of bits: the length of the shortest linear feedback shift
// register that gives it. Every generator that is linear over GF(2) with a state of s bits stays at
// s, where 2 s bits of a random sequence need about s as well, and more bits need more.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace tarn::quality {

// By J. L. Massey, Shift-Register Synthesis and BCH Decoding, IEEE Transactions on Information
// Theory 15, 1969. bits: one a byte. Takes about n^2 / 64 steps.
std::size_t linear_complexity(const std::vector<std::uint8_t>& bits);

// The chance that n fair bits have a smaller complexity than `length`, plus half the chance that
// they have this one. Of the 2^n sequences 2^min(2 n - 2 L, 2 L - 1) have L, and one has 0 (R. A.
// Rueppel, Analysis and Design of Stream Ciphers, Springer 1986). The half takes a part of the
// coarseness away: P(p <= x) and P(p >= 1 - x) are at most 1.6 x.
double linear_complexity_chance(std::size_t n, std::size_t length);

}  // namespace tarn::quality
