// SPDX-License-Identifier: Apache-2.0
// Products of a triangular factor with vectors, in place: a row needs the entries up to its own, so
// that rows are done from the last to the first, as many together as a vector has lanes.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/gaussian_mv_simd.cpp"
#include <limits>

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

// Numbers as they are.
struct as_given {
  template <class D>
  HWY_INLINE hn::Vec<D> operator()(D, hn::Vec<D> x) const {
    return x;
  }
};

// Numbers small enough for any sum of 2^31 products with normals, which are below 2^6. An exact
// scale, but for numbers that such sums do not notice.
struct lowered {
  static constexpr double scale = 0x1p-40;

  template <class D>
  HWY_INLINE hn::Vec<D> operator()(D d, hn::Vec<D> x) const {
    return hn::Mul(x, hn::Set(d, static_cast<hn::TFromD<D>>(scale)));
  }
};

template <class D>
HWY_INLINE bool all_finite(D d, hn::Vec<D> x) {
  return hn::AllTrue(d, hn::Le(hn::Abs(x), hn::Set(d, std::numeric_limits<hn::TFromD<D>>::max())));
}

// sum(lowered numbers), raised again and clamped. Out of the way, for it is hardly ever wanted.
template <class D, class Sum>
HWY_NOINLINE hn::Vec<D> clamped_sum(D d, const Sum& sum) {
  using real = hn::TFromD<D>;
  const auto greatest = hn::Set(d, std::numeric_limits<real>::max());
  const auto raised = hn::Mul(sum(lowered()), hn::Set(d, static_cast<real>(1 / lowered::scale)));
  return hn::Clamp(raised, hn::Neg(greatest), greatest);
}

// sum(numbers), without an overflow on the way.
template <class D, class Sum>
HWY_INLINE hn::Vec<D> without_overflow(D d, const Sum& sum) {
  const auto x = sum(as_given());
  return HWY_LIKELY(all_finite(d, x)) ? x : clamped_sum(d, sum);
}

// Rows first .. first + lanes - 1 of T z + mean.
template <class D>
struct rows_of_product {
  using real = hn::TFromD<D>;
  const real *columns, *mean;
  std::size_t dimension, first;
  const real* z;

  template <class Numbers>
  HWY_INLINE hn::Vec<D> operator()(const Numbers& numbers) const {
    const D d;
    auto sum = hn::Mul(numbers(d, entries(0)), hn::Set(d, z[0]));
    for (std::size_t c = 1; c <= first; ++c)
      sum = hn::Add(sum, hn::Mul(numbers(d, entries(c)), hn::Set(d, z[c])));
    // Columns that begin within these rows: lanes above the diagonal keep their sum. What is loaded
    // for them belongs to the column before.
    for (std::size_t c = first + 1; c < first + hn::Lanes(d); ++c) {
      const auto longer = hn::Add(sum, hn::Mul(numbers(d, entries(c)), hn::Set(d, z[c])));
      sum = hn::IfThenElse(hn::FirstN(d, c - first), sum, longer);
    }
    return hn::Add(sum, numbers(d, hn::LoadU(d, mean + first)));
  }

 private:
  HWY_INLINE hn::Vec<D> entries(std::size_t c) const {
    return hn::LoadU(D(), columns + column_origin(c, dimension) + first);
  }
};

// As many rows as a vector of D has lanes, in place.
template <class D, class Real>
HWY_INLINE void transform_rows(D d, const Real* columns, const Real* mean, std::size_t dimension,
                               std::size_t first, Real* z) {
  const rows_of_product<D> product{columns, mean, dimension, first, z};
  hn::StoreU(without_overflow(d, product), d, z + first);
}

// The first `end` rows: whole vectors, then one of half as many lanes and so on.
template <class D, class Real>
HWY_INLINE void transform_one(D d, const Real* columns, const Real* mean, std::size_t dimension,
                              std::size_t end, Real* z) {
  const std::size_t lanes = hn::Lanes(d);
  for (; end >= lanes; end -= lanes)
    transform_rows(d, columns, mean, dimension, end - lanes, z);
  if constexpr (hn::MaxLanes(D()) > 1)
    transform_one(hn::Half<D>(), columns, mean, dimension, end, z);
}

// The same where T is a diagonal.
template <class D>
struct scaled_rows {
  using real = hn::TFromD<D>;
  const real *scale, *mean, *z;

  template <class Numbers>
  HWY_INLINE hn::Vec<D> operator()(const Numbers& numbers) const {
    const D d;
    const auto scaled = hn::Mul(numbers(d, hn::LoadU(d, scale)), hn::LoadU(d, z));
    return hn::Add(scaled, numbers(d, hn::LoadU(d, mean)));
  }
};

template <class D, class Real>
HWY_INLINE void scale_rows(D d, const Real* scale, const Real* mean, std::size_t first, Real* z) {
  const scaled_rows<D> rows{scale + first, mean + first, z + first};
  hn::StoreU(without_overflow(d, rows), d, z + first);
}

template <class Real>
HWY_INLINE void scale_one(const Real* scale, const Real* mean, std::size_t dimension, Real* z) {
  const hn::ScalableTag<Real> d;
  const std::size_t lanes = hn::Lanes(d);
  std::size_t r = 0;
  for (; r + lanes <= dimension; r += lanes)
    scale_rows(d, scale, mean, r, z);
  for (; r < dimension; ++r)
    scale_rows(hn::CappedTag<Real, 1>(), scale, mean, r, z);
}

template <class Real>
HWY_INLINE void transform_all(const triangular_factor<Real>& factor, const Real* mean,
                              std::size_t dimension, std::size_t n, Real* vectors) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  for (std::size_t v = 0; v < n; ++v, vectors += dimension) {
    if (factor.diagonal())
      scale_one(factor.data(), mean, dimension, vectors);
    else
      transform_one(hn::ScalableTag<Real>(), factor.data(), mean, dimension, dimension, vectors);
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
