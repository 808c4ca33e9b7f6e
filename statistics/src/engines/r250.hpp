// SPDX-License-Identifier: Apache-2.0
// R250 (Kirkpatrick, Stoll: A very fast shift-register sequence random number generator, Journal of
// Computational Physics 40, 1981): x(n) = x(n-103) xor x(n-250), and its kernel.
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics::r250 {

inline constexpr std::size_t order = 250;
inline constexpr std::size_t lag = 103;

// Continues the sequence words[0..249] by `count` words, rounded up to whole steps of block_step.
void extend(std::uint32_t* words, std::size_t count);

}  // namespace tarn::statistics::r250
