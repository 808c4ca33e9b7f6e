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

// What a net is seeded with: nothing (1 dimension); the number of dimensions; or the number of
// dimensions, 1, `kind`, and `words` words of the user's for each dimension.
struct seed_form {
  const std::uint32_t* table;  // direction words of the dimensions that need none of the user's
  std::uint32_t table_dims;
  std::uint32_t kind;
  std::size_t words;
};

// The words of the user's for the first dimension, with those for the others behind them; null
// where the seed has none.
const std::uint32_t* users_words(span<std::uint32_t> seed);

// Bytes of the state of a net so seeded, or bad_seed if the words are of no such form, or the
// dimensions none or too many: a stream has less than 2^31 bytes.
std::size_t state_size(const seed_form& form, span<std::uint32_t> seed);

// Writes a first state. direct(words, directions) makes direction words v_1, ..., v_32 from the
// user's for one dimension.
int seed_state(void* state, const seed_form& form, span<std::uint32_t> seed,
               void (*direct)(const std::uint32_t* words, std::uint32_t* directions));

// The functions of engine_ops.
bool accepts(const void* state, std::size_t size, std::uint32_t member);
std::uint64_t remaining(const void* state);
void skip(void* state, span<std::uint64_t> digits);
void fill(void* state, std::uint32_t* out, std::size_t n);

}  // namespace tarn::statistics::net
