// SPDX-License-Identifier: Apache-2.0
// Digital sequences in base 2, 32 bits, in Gray-code order (Antonov and Saleev, USSR Comput. Math.
// Math. Phys. 19, 1979): what sobol and niederreiter share. The two differ in direction words only.
//
// With the direction words v_1, ..., v_32 of a dimension, point 0 is 0 and point i + 1 is point i
// xor v_(t+1), where t is the number of trailing one bits of i. Equally, point i is the xor of the
// v_(j+1) over the bits j of i xor i/2. Point 0 is left out; the sequence ends with point 2^32 - 1.
// Words come point by point, dimension by dimension.
#pragma once

#include <cstddef>
#include <cstdint>

#include "engine.hpp"

namespace tarn::statistics::net {

// Words of a dimension in the record: v_1, ..., v_32, and a word 0, so that the step behind the
// last point finds a word as well.
inline constexpr std::size_t direction_words = 33;

// Bytes of the state of a net of so many dimensions, or bad_seed if there are none or too many: a
// stream has less than 2^31 bytes.
std::size_t state_size(std::uint64_t dims);

// Writes the fields of a first state of `dims` dimensions and hands out the place of the direction
// words, all of them 0. place_first_point has to follow when they are written.
std::uint32_t* prepare(void* state, std::uint32_t dims);
void place_first_point(void* state);

// The functions of engine_ops.
bool accepts(const void* state, std::size_t size, std::uint32_t member);
std::uint64_t remaining(const void* state);
void skip(void* state, span<std::uint64_t> digits);
void fill(void* state, std::uint32_t* out, std::size_t n);

}  // namespace tarn::statistics::net
