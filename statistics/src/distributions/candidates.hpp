// SPDX-License-Identifier: Apache-2.0
// Candidates of real distributions: blocks of doubles that kernels turn into values or reject. They
// are doubles for results of type float as well, so that what is accepted, and every value up to
// its one last rounding, is exact far beyond the type of the results.
#pragma once

#include <algorithm>
#include <cstddef>

#include "blocks.hpp"
#include "distributions/canonical.hpp"
#include "distributions/rejection.hpp"

namespace tarn::statistics {

// A block of candidates: candidate i has the uniforms uniform[0][i], uniform[1][i] and so on, which
// follow each other in the stream, and becomes value[i], never negative unless it is rejected.
struct candidates {
  static constexpr std::size_t most_uniforms = 3;

  alignas(64) double uniform[most_uniforms][block_candidates];
  alignas(64) double value[block_candidates];
};

inline constexpr double rejected = -1;

// n rounded up: kernels work on whole vectors, of at most so many doubles.
inline constexpr std::size_t most_lanes = 8;
static_assert(block_candidates % most_lanes == 0 && block_words % most_lanes == 0);
constexpr std::size_t whole_vectors(std::size_t n) {
  return (n + most_lanes - 1) / most_lanes * most_lanes;
}

// Where standard variates go: place + scale * x in double, rounded once more for floats. Since
// rounding is monotonic, no result lies below `place` for x >= 0, nor above place + scale as
// rounded for x <= 1. Results beyond the greatest finite number give that number.
template <class Real>
struct affine_place {
  Real place, scale;
};

// Hands the n candidates of `width` uniforms (2 or 3) of `interleaved` to the columns of a block.
void split_uniforms(const double* interleaved, std::size_t n, std::size_t width, candidates& to);

// Moves the values of the first n candidates that are not rejected to the front; gives their
// number.
std::size_t keep_accepted(candidates& block, std::size_t n);

void put_in_place(const double* x, std::size_t n, const affine_place<float>& where, float* out);
void put_in_place(const double* x, std::size_t n, const affine_place<double>& where, double* out);

// Draws n variates by rejection: `Method` has the width of its candidates, and
// method.attempt(block, count) turns the first `count` candidates (at least; up to whole vectors)
// into values or rejects them. On the calling thread, for the number of words is not known before.
template <class Real, class Method>
void draw_by_rejection(const word_source& source, std::size_t n, const Method& method,
                       const affine_place<Real>& where, Real* out) {
  const canonical<double> uniforms(source, 0, 1);
  alignas(64) double interleaved[Method::width * block_candidates];
  candidates block;
  draw_accepted(n, out, [&](std::size_t count, Real* to) {
    uniforms.draw(source, Method::width * count, interleaved);
    const std::size_t whole = whole_vectors(count);
    std::fill(interleaved + Method::width * count, interleaved + Method::width * whole, 0.5);
    split_uniforms(interleaved, whole, Method::width, block);
    method.attempt(block, count);
    const std::size_t accepted = keep_accepted(block, count);
    put_in_place(block.value, accepted, where, to);
    return accepted;
  });
}

}  // namespace tarn::statistics
