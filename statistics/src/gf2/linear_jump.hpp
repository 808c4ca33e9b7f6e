// SPDX-License-Identifier: Apache-2.0
// Long jumps in sequences that obey a linear recurrence over GF(2). With t the step to the next
// element and P a polynomial that annihilates the sequence, t^distance is congruent modulo P to a
// polynomial with few terms, and the element `distance` steps on is the sum of the elements which
// these terms name (Haramoto, Matsumoto, Nishimura, Panneton, L'Ecuyer: Efficient Jump Ahead for
// F2-Linear Random Number Generators, INFORMS Journal on Computing 20, 2008).
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics {

// The minimal polynomial of a recurrence.
struct jump_polynomial;

// Of the untempered words of mt19937; a step is one word.
extern const jump_polynomial mt19937_minimal;

// Of every bit of the 128-bit words of sfmt19937; a step is four 32-bit words.
extern const jump_polynomial sfmt19937_minimal;

// Elements that the terms may name.
inline constexpr std::size_t jump_terms = 19968;

// Writes `count` words of the sequence that stand `distance` steps of `stride` words behind its
// first `count` words. `words` holds the sequence from its present place on, jump_terms * stride +
// count words; out does not overlap it. The first 31 elements may hold bits that later ones ignore
// (the low 31 bits of the first word of mt19937's state). Throws std::bad_alloc only, and before it
// writes.
void jump(const jump_polynomial& p, std::uint64_t distance, const std::uint32_t* words,
          std::size_t stride, std::size_t count, std::uint32_t* out);

}  // namespace tarn::statistics
