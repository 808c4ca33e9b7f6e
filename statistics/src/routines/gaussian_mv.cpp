// SPDX-License-Identifier: Apache-2.0
// The raw routines of gaussian_mv.
#include "distributions/gaussian_mv.hpp"

#include <algorithm>

#include "distributions/normal.hpp"
#include "routines/rows.hpp"

namespace {

using namespace tarn::statistics;

// Vectors that are filled with standard normals and transformed while they are in the nearest
// cache: about 2048 numbers. An even number of them, so that no pair of Box and Muller is cut.
std::size_t vectors_together(std::size_t dimension) {
  return std::max(std::size_t{1024} / dimension, std::size_t{1}) * 2;
}

template <class Real, class Normals>
int correlated(const live_stream& s, int n, Real* r, std::size_t dimension,
               std::size_t words_per_normal, const Normals& normals,
               const triangular_factor<Real>& factor, const Real* mean) {
  const auto vectors = static_cast<std::size_t>(n);
  const std::size_t words = dimension * words_per_normal;
  if (!has_words(s, vectors * words))
    return RVX_STATUS_END_OF_SEQUENCE;
  const std::size_t together = vectors_together(dimension);
  const auto write = [&](const word_source& source, std::size_t first, std::size_t count) {
    for (std::size_t end = first + count; first != end;) {
      const std::size_t some = std::min(together, end - first);
      Real* const to = r + first * dimension;
      normals(source, some * dimension, to, false);
      transform_vectors(factor, mean, dimension, some, to);
      first += some;
    }
  };
  const word_source source = source_of(s);
  // Threads share out pairs of vectors.
  draw_rows(source, vectors / 2, 2 * words, r,
            [&](const word_source& from, std::size_t first, std::size_t count) {
              write(from, 2 * first, 2 * count);
            });
  write(source, vectors / 2 * 2, vectors % 2);
  return RVX_STATUS_OK;
}

template <class Real>
int gaussian_mv(int method, void* stream, int n, Real* r, std::int32_t dimension,
                std::int32_t layout, const Real* mean, const Real* matrix) {
  if (method > RVX_RNG_METHOD_GAUSSIAN_ICDF)
    return -1;
  return routine(method, parameters::gaussian_methods, stream, n, r, [&](const live_stream& s) {
    if (const int bad = parameters::gaussian_mv(dimension, layout, mean, matrix);
        bad != parameters::good)
      return -bad;
    const auto width = static_cast<std::size_t>(dimension);
    if (!parameters::all_finite(mean, width))
      return -7;
    const triangular_factor<Real> factor(layout, width, matrix);
    if (!parameters::all_finite(factor.data(), factor.entries()))
      return -8;
    const normal_end<Real> standard = gaussian_end<Real>(0, 1);
    switch (method) {
      case RVX_RNG_METHOD_GAUSSIAN_BOXMULLER:
        return correlated(s, n, r, width, 2, box_muller<Real>{standard}, factor, mean);
      case RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2:
        return correlated(s, n, r, width, 1, box_muller2<Real>{standard}, factor, mean);
      default:
        return correlated(s, n, r, width, 1, normal_inversion<Real>{standard}, factor, mean);
    }
  });
}

}  // namespace

int _rvxsRngGaussianMV(int method, void* stream, int n, float* r, std::int32_t dimension,
                       std::int32_t layout, const float* mean, const float* matrix) {
  return gaussian_mv(method, stream, n, r, dimension, layout, mean, matrix);
}

int _rvxdRngGaussianMV(int method, void* stream, int n, double* r, std::int32_t dimension,
                       std::int32_t layout, const double* mean, const double* matrix) {
  return gaussian_mv(method, stream, n, r, dimension, layout, mean, matrix);
}
