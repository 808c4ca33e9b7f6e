// SPDX-License-Identifier: Apache-2.0
// The factor of correlated normals in the order in which it is used.
#include "distributions/gaussian_mv.hpp"

namespace tarn::statistics {

template <class Real>
triangular_factor<Real>::triangular_factor(std::int32_t layout, std::size_t dimension,
                                           const Real* matrix)
    : diagonal_(layout == 2),
      entries_(diagonal_ ? dimension : dimension * (dimension + 1) / 2),
      data_(matrix) {
  if (layout != 0)
    return;
  columns_.reserve(entries_);
  for (std::size_t c = 0; c < dimension; ++c)
    for (std::size_t r = c; r < dimension; ++r)
      columns_.push_back(matrix[r * dimension + c]);
  data_ = columns_.data();
}

template class triangular_factor<float>;
template class triangular_factor<double>;

}  // namespace tarn::statistics
