// SPDX-License-Identifier: Apache-2.0
// The distributions on a GPU queue whose results are rows, or have parameters of their own:
// gaussian_mv in its layouts and methods, multinomial, poisson_v.
#include <cmath>
#include <numeric>

#include "device_laws.hpp"

namespace {

using namespace tarn_test;

template <typename Engine>
class vector_laws : public device_laws<Engine> {};
TYPED_TEST_SUITE(vector_laws, engines_of_laws, name_of_engine);

constexpr std::size_t d = 3;
constexpr double mean[d] = {-0.5, 0.25, 2};
constexpr double factor[d][d] = {{1.5, 99, 99}, {0.5, 0.75, 99}, {-0.25, 0.5, 2}};

/// An element of the factor: what stands above the diagonal is not part of it.
double element(rng::matrix_layout layout, std::size_t r, std::size_t c) {
  return c > r || (layout == rng::matrix_layout::diagonal && c != r) ? 0 : factor[r][c];
}

template <typename T>
std::vector<T> stored(rng::matrix_layout layout) {
  using rng::matrix_layout;
  std::vector<T> matrix;
  for (std::size_t i = 0; i < d; ++i) {
    for (std::size_t j = 0; j < d; ++j) {
      if (layout == matrix_layout::full) {  // row after row, whatever stands above the diagonal
        matrix.push_back(static_cast<T>(factor[i][j]));
      } else if (layout == matrix_layout::packed ? j >= i : j == i) {  // column after column
        matrix.push_back(static_cast<T>(factor[j][i]));
      }
    }
  }
  return matrix;
}

/// The normals behind a result: z with T z = x - mean.
std::vector<double> normals(rng::matrix_layout layout, const double* x) {
  std::vector<double> z(d);
  for (std::size_t r = 0; r < d; ++r) {
    double rest = x[r] - mean[r];
    for (std::size_t c = 0; c < r; ++c) {
      rest -= element(layout, r, c) * z[c];
    }
    z[r] = rest / element(layout, r, r);
  }
  return z;
}

/// The last coordinate, and sums of the normals, which have the law of a single one only if they
/// are not correlated.
template <typename T>
std::vector<laws::view> views_of(rng::matrix_layout layout) {
  laws::grain resolution = laws::resolution_of<T>(0);
  resolution.place = 4.0 * d;  // sums of d terms, and back
  double variance = 0;
  for (std::size_t c = 0; c < d; ++c) {
    variance += element(layout, d - 1, c) * element(layout, d - 1, c);
  }
  std::vector<laws::view> views;
  views.push_back({laws::gaussian(mean[d - 1], std::sqrt(variance)), resolution,
                   [](const double* x) { return x[d - 1]; }});
  const double half = std::sqrt(0.5);
  const double weights[][d] = {{half, half, 0}, {half, 0, half}, {0, half, -half}};
  for (const auto& w : weights) {
    views.push_back({laws::gaussian(0, 1), resolution, [=](const double* x) {
                       const auto z = normals(layout, x);
                       return w[0] * z[0] + w[1] * z[1] + w[2] * z[2];
                     }});
  }
  return views;
}

template <typename T>
std::vector<T> centre() {
  return {static_cast<T>(mean[0]), static_cast<T>(mean[1]), static_cast<T>(mean[2])};
}

TYPED_TEST(vector_laws, of_gaussian_mv_hold) {
  using rng::gaussian_mv;
  using rng::matrix_layout;
  int rows = 0;
  const auto expect = [&](const auto& distr, const std::string& what, matrix_layout layout) {
    using T = typename std::remove_reference_t<decltype(distr)>::result_type;
    ++rows;
    this->expect_laws(what, distr, views_of<T>(layout), results_of_case<TypeParam>() / 2 + 1, d);
  };
#define TARN_EXPECT(T, L, M)                                           \
  expect(gaussian_mv<T, matrix_layout::L, rng::gaussian_mv_method::M>( \
             d, centre<T>(), stored<T>(matrix_layout::L)),             \
         #T " " #L " " #M, matrix_layout::L);
#define TARN_EXPECT_ALL(T, L)    \
  TARN_EXPECT(T, L, box_muller)  \
  TARN_EXPECT(T, L, box_muller2) \
  TARN_EXPECT(T, L, icdf)
  TARN_EXPECT_ALL(float, full)
  TARN_EXPECT_ALL(float, packed)
  TARN_EXPECT_ALL(float, diagonal)
  TARN_EXPECT_ALL(double, full)
  TARN_EXPECT_ALL(double, packed)
  TARN_EXPECT_ALL(double, diagonal)
  EXPECT_EQ(rows, 18);
}

/// Weights 1, 3, 1, 3, ... of k categories, whose sums in float are exact for a k of a power of 2.
std::vector<double> uneven(std::size_t k) {
  std::vector<double> p;
  for (std::size_t i = 0; i < k; ++i) {
    p.push_back((i % 2 == 0 ? 1 : 3) / (2 * static_cast<double>(k)));
  }
  return p;
}

// The greatest number of trials, the fewest categories for each number of them, and a single one.
TYPED_TEST(vector_laws, of_multinomial_hold) {
  const std::pair<std::int32_t, std::size_t> sets[] = {
      {1, 16}, {1, 64}, {2, 32}, {7, 128}, {16, 256}};
  for (const auto& [ntrial, k] : sets) {
    const std::vector<double> p = uneven(k);
    const auto sum_of = [](std::size_t from, std::size_t to) {
      return [=](const double* x) { return std::accumulate(x + from, x + to, 0.0); };
    };
    const std::size_t half = k / 2, all = k;
    this->expect_laws(
        text_of("multinomial", ntrial, k), rng::multinomial<>(ntrial, p),
        {law_of_integers(laws::binomial(ntrial, p[0])),
         {laws::binomial(ntrial, p[k - 1]), laws::integer_resolution(), sum_of(all - 1, all)},
         {laws::binomial(ntrial, 0.5), laws::integer_resolution(), sum_of(0, half)},
         {laws::binomial(ntrial, 1), laws::integer_resolution(), sum_of(0, all)}},
        20'000, k);
  }
}

// Rates on both sides of 1/16 and of 2^13, and of every power of two between them in some row.
TYPED_TEST(vector_laws, of_poisson_v_hold) {
  const double rows[][4] = {
      {0.01, 0.0624, 0.0625, 0.12}, {0.25, 0.51, 1, 2.5},    {4, 10, 17, 40},
      {64, 99.9, 128, 300},         {512, 1024, 3000, 4097}, {8191, 8192, 1e5, 1e7}};
  for (const auto& row : rows) {
    std::vector<double> rates;
    for (std::int64_t i = 0; i < 4 * results_of_approximation; ++i) {
      rates.push_back(row[i % 4]);
    }
    std::vector<laws::view> views;
    for (std::size_t i = 0; i < 4; ++i) {
      views.push_back(law_of_approximation(laws::poisson(row[i])));
      views.back().of = [i](const double* x) { return x[i]; };
    }
    this->expect_laws_of_rows(text_of("poisson_v", row[0], row[3]), rng::poisson_v<>(rates), views,
                              results_of_approximation, 4);
  }
}

TARN_REPORTS_CUDA(vector_laws)

}  // namespace
