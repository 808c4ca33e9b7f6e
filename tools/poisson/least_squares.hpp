// SPDX-License-Identifier: Apache-2.0
// Weighted least squares by the normal equations, in so many digits that their condition does not
// count.
#pragma once

#include <array>
#include <cstddef>
#include <utility>

#include <boost/multiprecision/cpp_bin_float.hpp>

namespace poisson {

template <std::size_t unknowns>
class least_squares {
 public:
  using row = std::array<long double, unknowns>;

  // One equation row . x = value, whose error counts `weight` times.
  void add(const row& coefficients, long double value, long double weight) {
    for (std::size_t i = 0; i < unknowns; ++i) {
      const exact w = exact(coefficients[i]) * weight * weight;
      for (std::size_t j = 0; j < unknowns; ++j)
        system_[i][j] += w * coefficients[j];
      system_[i][unknowns] += w * value;
    }
  }

  // By elimination: the matrix is positive definite and needs no exchange of rows.
  row solution() const {
    auto a = system_;
    for (std::size_t i = 0; i < unknowns; ++i)
      for (std::size_t r = 0; r < unknowns; ++r)
        if (r != i) {
          const exact factor = a[r][i] / a[i][i];
          for (std::size_t c = i; c <= unknowns; ++c)
            a[r][c] -= factor * a[i][c];
        }
    row x{};
    for (std::size_t i = 0; i < unknowns; ++i)
      x[i] = exact(a[i][unknowns] / a[i][i]).template convert_to<long double>();
    return x;
  }

 private:
  using exact = boost::multiprecision::cpp_bin_float_50;
  std::array<std::array<exact, unknowns + 1>, unknowns> system_{};
};

}  // namespace poisson
