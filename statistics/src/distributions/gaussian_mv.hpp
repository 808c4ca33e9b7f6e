// SPDX-License-Identifier: Apache-2.0
// Correlated normals: vectors of standard normals become mean + T z in place, with the lower
// triangular factor T of the covariance.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace tarn::statistics {

// T as it is used: column after column from the diagonal on, or the diagonal alone.
template <class Real>
class triangular_factor {
 public:
  // Layouts 0 (all rows, entries above the diagonal ignored), 1 (columns from the diagonal on) and
  // 2 (the diagonal).
  triangular_factor(std::int32_t layout, std::size_t dimension, const Real* matrix);
  triangular_factor(const triangular_factor&) = delete;

  bool diagonal() const { return diagonal_; }
  const Real* data() const { return data_; }
  std::size_t entries() const { return entries_; }

 private:
  bool diagonal_;
  std::size_t entries_;
  std::vector<Real> columns_;  // of layout 0
  const Real* data_;
};

// x = (T[r][0] z[0] + T[r][1] z[1] + ... + T[r][r] z[r]) + mean[r], each product and sum rounded as
// if it had no greatest exponent, for n vectors in place. Results beyond the greatest finite number
// are that number.
void transform_vectors(const triangular_factor<float>& factor, const float* mean,
                       std::size_t dimension, std::size_t n, float* vectors);
void transform_vectors(const triangular_factor<double>& factor, const double* mean,
                       std::size_t dimension, std::size_t n, double* vectors);

}  // namespace tarn::statistics
