// SPDX-License-Identifier: Apache-2.0
// Products of a triangular factor with vectors, in place: a row needs the entries up to its own, so
// that rows are done from the last to the first, as many together as a vector has lanes.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/gaussian_mv_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/gaussian_mv.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// Where the column c of the packed factor begins, less c: entry r stands r behind.
HWY_INLINE std::size_t column_origin(std::size_t c, std::size_t dimension) {
  return c * dimension - c * (c + 1) / 2;
}

// Rows first .. first + lanes - 1 of T z + mean.
template <class D, class Real>
HWY_INLINE hn::Vec<D> rows_of_product(D d, const Real* columns, const Real* mean,
                                      std::size_t dimension, std::size_t first, const Real* z) {
  auto sum = hn::Mul(hn::LoadU(d, columns + first), hn::Set(d, z[0]));
  for (std::size_t c = 1; c <= first; ++c) {
    const auto entries = hn::LoadU(d, columns + column_origin(c, dimension) + first);
    sum = hn::Add(sum, hn::Mul(entries, hn::Set(d, z[c])));
  }
  // Columns that begin within these rows: lanes above the diagonal keep their sum. What is loaded
  // for them belongs to the column before.
  for (std::size_t c = first + 1; c < first + hn::Lanes(d); ++c) {
    const auto entries = hn::LoadU(d, columns + column_origin(c, dimension) + first);
    const auto longer = hn::Add(sum, hn::Mul(entries, hn::Set(d, z[c])));
    sum = hn::IfThenElse(hn::FirstN(d, c - first), sum, longer);
  }
  return hn::Add(sum, hn::LoadU(d, mean + first));
}

template <class Real>
HWY_INLINE void transform_one(const Real* columns, const Real* mean, std::size_t dimension,
                              Real* z) {
  const hn::ScalableTag<Real> d;
  const std::size_t lanes = hn::Lanes(d);
  std::size_t end = dimension;
  for (; end >= lanes; end -= lanes)
    hn::StoreU(rows_of_product(d, columns, mean, dimension, end - lanes, z), d, z + end - lanes);
  while (end-- > 0) {
    Real sum = columns[end] * z[0];
    for (std::size_t c = 1; c <= end; ++c)
      sum = sum + columns[column_origin(c, dimension) + end] * z[c];
    z[end] = sum + mean[end];
  }
}

template <class Real>
HWY_INLINE void scale_one(const Real* scale, const Real* mean, std::size_t dimension, Real* z) {
  const hn::ScalableTag<Real> d;
  const std::size_t lanes = hn::Lanes(d);
  std::size_t r = 0;
  for (; r + lanes <= dimension; r += lanes) {
    const auto scaled = hn::Mul(hn::LoadU(d, scale + r), hn::LoadU(d, z + r));
    hn::StoreU(hn::Add(scaled, hn::LoadU(d, mean + r)), d, z + r);
  }
  for (; r < dimension; ++r)
    z[r] = scale[r] * z[r] + mean[r];
}

template <class Real>
HWY_INLINE void transform_all(const triangular_factor<Real>& factor, const Real* mean,
                              std::size_t dimension, std::size_t n, Real* vectors) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  for (std::size_t v = 0; v < n; ++v, vectors += dimension) {
    if (factor.diagonal())
      scale_one(factor.data(), mean, dimension, vectors);
    else
      transform_one(factor.data(), mean, dimension, vectors);
  }
}

void transform_floats(const triangular_factor<float>& factor, const float* mean,
                      std::size_t dimension, std::size_t n, float* vectors) {
  transform_all(factor, mean, dimension, n, vectors);
}

void transform_doubles(const triangular_factor<double>& factor, const double* mean,
                       std::size_t dimension, std::size_t n, double* vectors) {
  transform_all(factor, mean, dimension, n, vectors);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(transform_floats);
HWY_EXPORT(transform_doubles);

void transform_vectors(const triangular_factor<float>& factor, const float* mean,
                       std::size_t dimension, std::size_t n, float* vectors) {
  TARN_SIMD_CALL(transform_floats)(factor, mean, dimension, n, vectors);
}

void transform_vectors(const triangular_factor<double>& factor, const double* mean,
                       std::size_t dimension, std::size_t n, double* vectors) {
  TARN_SIMD_CALL(transform_doubles)(factor, mean, dimension, n, vectors);
}

}  // namespace tarn::statistics
#endif
