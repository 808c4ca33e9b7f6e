// SPDX-License-Identifier: Apache-2.0
// Kernels of the normal family: standard normals by the method of Box and Muller (A note on the
// generation of random normal deviates, Annals of Mathematical Statistics 29, 1958), and what
// gaussian and lognormal make of standard normals. Each is a pass of its own over a block in the
// nearest cache: the steps of one long pass would wait for each other.
#pragma once

#include <algorithm>
#include <cstddef>
#include <limits>

#include "blocks.hpp"
#include "distributions/placement.hpp"

namespace tarn::statistics {

// What becomes of a standard normal z.
template <class Real>
struct normal_end {
  bool exponential;  // false: z is placed itself; true: exp(inner.scale * z + inner.offset) is
  affine<Real> inner;
  placement<Real> outer;
};

template <class Real>
normal_end<Real> gaussian_end(Real mean, Real stddev) {
  return {false, {}, placed(mean, stddev)};
}

template <class Real>
normal_end<Real> lognormal_end(Real m, Real s, Real displ, Real scale, bool accurate) {
  return {true, {s, m}, placed(displ, scale, accurate)};
}

// The same of z = sqrt(2) x, for x as it is.
template <class Real>
normal_end<Real> end_of_erfinv(normal_end<Real> end) {
  Real& scale = end.exponential ? end.inner.scale : end.outer.map.scale;
  // Finite: an infinite scale would make zero not a number.
  scale =
      std::min(scale * static_cast<Real>(1.41421356237309504880), std::numeric_limits<Real>::max());
  return end;
}

// n values from n normals. In place if out is z. `streaming` stores around the caches.
void end_normals(const float* z, std::size_t n, const normal_end<float>& end, bool streaming,
                 float* out);
void end_normals(const double* z, std::size_t n, const normal_end<double>& end, bool streaming,
                 double* out);

// The pairs that the next kernels take at a time.
inline constexpr std::size_t box_muller_block = block_words / 2;

// Pairs (u0, u1) of reals of [0, 1] in place: to the normal sqrt(-2 ln u0) sin(2 pi u1), the first
// `pairs` numbers, and to two, the second one with the cosine.
void box_muller_sines(float* u, std::size_t pairs);
void box_muller_sines(double* u, std::size_t pairs);
void box_muller_pairs(float* u, std::size_t pairs);
void box_muller_pairs(double* u, std::size_t pairs);

}  // namespace tarn::statistics
