// SPDX-License-Identifier: Apache-2.0
// gaussian_mv on GPUs: vectors against a serial transform of the normals that an equal engine gives
// to gaussian, to the bit; the law of the vectors; parameters at their ends.
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <memory>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "level_calls.hpp"
#include "message.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using rng::matrix_layout;
using tarn_test::both_forms;
using tarn_test::device_type;
using tarn_test::draw;
using tarn_test::draw_at_level;
using tarn_test::engine_case;
using tarn_test::gpu_queue;
using tarn_test::output_form;
namespace method = rng::gaussian_mv_method;
using philox_case = engine_case<rng::philox4x32x10, device_type::gpu>;

template <typename Method>
using normal_method = std::conditional_t<
    std::is_same_v<Method, method::icdf>, rng::gaussian_method::icdf,
    std::conditional_t<std::is_same_v<Method, method::box_muller>, rng::gaussian_method::box_muller,
                       rng::gaussian_method::box_muller2>>;

template <typename T>
std::vector<T> some_means(std::size_t d) {
  std::vector<T> mean;
  for (std::size_t r = 0; r < d; ++r) {
    mean.push_back(static_cast<T>(0.3) * static_cast<T>(r) - static_cast<T>(1.7));
  }
  return mean;
}

/// An entry on or below the diagonal.
template <typename T>
T entry(std::size_t r, std::size_t c) {
  return static_cast<T>(r == c ? 1.1 : 0.37) / static_cast<T>(1 + (r + 3 * c) % 11) *
         static_cast<T>((r + c) % 3 == 1 ? -1 : 1);
}

/// The factor in a layout; entries above the diagonal are no numbers.
template <typename T>
std::vector<T> stored(matrix_layout layout, std::size_t d) {
  std::vector<T> matrix;
  for (std::size_t i = 0; i < d; ++i) {
    if (layout == matrix_layout::diagonal) {
      matrix.push_back(entry<T>(i, i));
    } else if (layout == matrix_layout::packed) {  // i is a column
      for (std::size_t r = i; r < d; ++r) {
        matrix.push_back(entry<T>(r, i));
      }
    } else {  // i is a row
      for (std::size_t c = 0; c < d; ++c) {
        matrix.push_back(c > i ? std::numeric_limits<T>::quiet_NaN() : entry<T>(i, c));
      }
    }
  }
  return matrix;
}

template <typename T, matrix_layout layout, typename Method>
rng::gaussian_mv<T, layout, Method> some_vectors(std::size_t d) {
  return rng::gaussian_mv<T, layout, Method>(static_cast<std::uint32_t>(d), some_means<T>(d),
                                             stored<T>(layout, d));
}

/// mean + T z for each vector z, row by row of T. A sum begins with a rounded product and goes on
/// with fused ones; a diagonal alone is one fused step.
template <typename T>
std::vector<T> model(matrix_layout layout, std::size_t d, const std::vector<T>& z) {
  const std::vector<T> mean = some_means<T>(d);
  std::vector<T> x(z.size());
  for (std::size_t i = 0; i < z.size(); ++i) {
    const std::size_t r = i % d;
    const T* vector = z.data() + (i - r);
    if (layout == matrix_layout::diagonal) {
      x[i] = std::fma(entry<T>(r, r), vector[r], mean[r]);
    } else {
      T sum = entry<T>(r, 0) * vector[0];
      for (std::size_t c = 1; c <= r; ++c) {
        sum = std::fma(entry<T>(r, c), vector[c], sum);
      }
      x[i] = sum + mean[r];
    }
  }
  return x;
}

/// n vectors in both forms against the model of `normals`, and where the calls leave the engine.
template <typename Case, typename T, matrix_layout layout, typename Method>
void expect_vectors(std::size_t d, std::int64_t n, const std::vector<T>& normals) {
  const auto distr = some_vectors<T, layout, Method>(d);
  const std::vector<T> expected = model(layout, d, normals);
  constexpr std::int64_t words = std::is_same_v<Method, method::box_muller> ? 2 : 1;
  for (const output_form form : both_forms) {
    auto engine = Case::make(gpu_queue());
    const auto drawn = draw_at_level(form, distr, engine, n, normals.size());
    ASSERT_EQ(drawn.values, expected) << n << " vectors of " << d;
    ASSERT_EQ(drawn.consumed, words * n * static_cast<std::int64_t>(d));
    tarn_test::expect_next<Case>(engine, drawn.consumed, 5);
  }
}

template <typename Case, typename T, typename Method>
void expect_layouts(std::size_t d, std::int64_t n) {
  SCOPED_TRACE(testing::Message() << n << " vectors of " << d << ", " << sizeof(T) << " bytes");
  auto engine = Case::make(gpu_queue());
  const rng::gaussian<T, normal_method<Method>> standard(0, 1);
  const std::vector<T> normals = draw(standard, engine, n * static_cast<std::int64_t>(d));
  expect_vectors<Case, T, matrix_layout::full, Method>(d, n, normals);
  expect_vectors<Case, T, matrix_layout::packed, Method>(d, n, normals);
  expect_vectors<Case, T, matrix_layout::diagonal, Method>(d, n, normals);
}

template <typename Case>
void expect_methods(std::size_t d, std::int64_t n) {
  expect_layouts<Case, float, method::box_muller>(d, n);
  expect_layouts<Case, float, method::box_muller2>(d, n);
  expect_layouts<Case, float, method::icdf>(d, n);
  expect_layouts<Case, double, method::box_muller>(d, n);
  expect_layouts<Case, double, method::box_muller2>(d, n);
  expect_layouts<Case, double, method::icdf>(d, n);
}

// Odd counts of values end in the middle of a pair of normals, and odd dimensions put pairs across
// the ends of vectors. Counts that are no multiple of four leave the last work-group without all
// of its vectors, and there are guards behind the others.
TEST(gaussian_mv_on_a_gpu, transforms_the_normals_of_gaussian) {
  for (const std::size_t d : {1u, 2u, 3u, 7u, 65u}) {
    for (const std::int64_t n : {0, 1, 3, 4, 5, 1001}) {
      expect_methods<philox_case>(d, n);
    }
  }
}

template <typename Case>
class gaussian_mv_on : public testing::Test {};
TYPED_TEST_SUITE(gaussian_mv_on, tarn_test::device_cases, tarn_test::case_name);

TYPED_TEST(gaussian_mv_on, transforms_the_normals_of_gaussian) {
  for (const std::int64_t n : {0, 1, 5, 101}) {
    expect_layouts<TypeParam, float, method::box_muller>(3, n);
    expect_layouts<TypeParam, double, method::icdf>(3, n);
  }
}

// Without an index mt2203 has as many generators as the device has compute units.
TEST(gaussian_mv_on_a_gpu, transforms_what_a_family_of_generators_draws) {
  rng::mt2203 family(gpu_queue(), 7);
  rng::mt2203 same(gpu_queue(), 7);
  const auto z = draw(rng::gaussian<double, rng::gaussian_method::icdf>(), family, 3 * 501);
  const auto distr = some_vectors<double, matrix_layout::full, method::icdf>(3);
  EXPECT_EQ(draw(distr, same, 501, 3), model(matrix_layout::full, 3, z));
}

TEST(gaussian_mv_on_a_gpu, goes_through_generate_in_both_forms) {
  const auto distr = some_vectors<float, matrix_layout::packed, method::box_muller2>(7);
  auto normals = philox_case::make();
  auto engine = philox_case::make();
  auto same = philox_case::make();
  const auto z = draw(rng::gaussian<float>(), normals, 7 * 77);
  EXPECT_EQ(draw(distr, engine, 77, 7), model(matrix_layout::packed, 7, z));
  EXPECT_EQ(tarn_test::draw_into_buffer(distr, same, 77, 7), model(matrix_layout::packed, 7, z));
}

/// 3000 values of one dimension in a layout with all words of the same engine.
template <matrix_layout layout>
std::vector<float> one_dimension() {
  auto engine = philox_case::make();
  const rng::gaussian_mv<float, layout, method::icdf> distr(1, {0.7f}, {1.3f});
  return draw(distr, engine, 3000);
}

TEST(gaussian_mv_on_a_gpu, one_dimension_is_a_scale_and_a_shift) {
  auto engine = philox_case::make();
  const auto z = draw(rng::gaussian<float, rng::gaussian_method::icdf>(), engine, 3000);
  std::vector<float> rounded_twice;
  std::vector<float> rounded_once;
  for (const float value : z) {
    const float product = 1.3f * value;
    rounded_twice.push_back(product + 0.7f);
    rounded_once.push_back(std::fma(1.3f, value, 0.7f));
  }
  EXPECT_EQ(one_dimension<matrix_layout::full>(), rounded_twice);
  EXPECT_EQ(one_dimension<matrix_layout::packed>(), rounded_twice);
  EXPECT_EQ(one_dimension<matrix_layout::diagonal>(), rounded_once);
}

TEST(gaussian_mv_on_a_gpu, a_diagonal_parts_in_the_last_place_from_a_full_factor_of_the_same) {
  const auto full = one_dimension<matrix_layout::full>();
  const auto diagonal = one_dimension<matrix_layout::diagonal>();
  int parted = 0;
  for (std::size_t i = 0; i < full.size(); ++i) {
    parted += full[i] != diagonal[i] ? 1 : 0;
    // The product, below 8, is rounded by half a place, 2^-22 at most; each result by as much.
    EXPECT_NEAR(full[i], diagonal[i], 0x3p-22);
  }
  EXPECT_GT(parted, 100);
  EXPECT_LT(parted, 2900);
}

TEST(gaussian_mv_on_a_gpu, entries_above_the_diagonal_of_a_full_factor_have_no_effect) {
  const auto with = [](float above) {
    auto engine = philox_case::make();
    return draw(rng::gaussian_mv<float>(2, {1, 2}, {0.5f, above, -0.25f, 1.5f}), engine, 101, 2);
  };
  EXPECT_EQ(with(0), with(7));
  EXPECT_EQ(with(0), with(std::numeric_limits<float>::quiet_NaN()));
}

TEST(gaussian_mv_on_a_gpu, vectors_of_no_dimensions_are_none) {
  const rng::gaussian_mv<double, matrix_layout::packed> nothing(0, {}, {});
  for (const output_form form : both_forms) {
    auto engine = philox_case::make();
    const auto drawn = draw_at_level(form, nothing, engine, 5, 0);
    EXPECT_EQ(drawn.consumed, 0);
    tarn_test::expect_next<philox_case>(engine, 0, 5);
  }
}

TEST(gaussian_mv_on_a_gpu, parameters_are_done_with_when_the_call_returns) {
  using distr_type = rng::gaussian_mv<double, matrix_layout::full, method::icdf>;
  auto normals = philox_case::make();
  auto engine = philox_case::make();
  const auto z = draw(rng::gaussian<double, rng::gaussian_method::icdf>(), normals, 7 * 301);
  std::vector<double> values(7 * 301, tarn_test::marker<double>());
  {
    sycl::buffer<double, 1> buffer(values.data(), sycl::range<1>(values.size()));
    auto distr =
        std::make_unique<distr_type>(some_vectors<double, matrix_layout::full, method::icdf>(7));
    rng::generate(*distr, engine, 301, buffer);
    distr.reset();
  }
  EXPECT_EQ(values, model(matrix_layout::full, 7, z));
}

// A work-group keeps the sums of a vector in local memory; a diagonal factor has none.
TEST(gaussian_mv_on_a_gpu, diagonal_factors_have_any_dimension) {
  sycl::queue queue = gpu_queue();
  const std::size_t local = queue.get_device().get_info<sycl::info::device::local_mem_size>();
  const std::size_t d = local / sizeof(double) + 1;
  auto engine = philox_case::make(queue);
  auto same = philox_case::make(queue);
  const auto z = draw(rng::gaussian<double, rng::gaussian_method::icdf>(), same,
                      static_cast<std::int64_t>(3 * d));
  EXPECT_EQ(draw(some_vectors<double, matrix_layout::diagonal, method::icdf>(d), engine, 3, d),
            model(matrix_layout::diagonal, d, z));
}

// Counts whose product with the dimension does not fit 64 bits must not wrap into small ones.
TEST(gaussian_mv_on_a_gpu, counts_past_the_range_of_a_kernel_are_refused) {
  const auto distr = some_vectors<float, matrix_layout::full, method::icdf>(4);
  auto engine = philox_case::make();
  float value = 7;
  for (const std::int64_t n : {std::int64_t{1} << 62, (std::int64_t{1} << 62) + 1,
                               std::numeric_limits<std::int64_t>::max()}) {
    EXPECT_THROW(rng::generate(distr, engine, n, &value), sycl::exception) << n;
  }
  EXPECT_EQ(value, 7);
}

// 200000 vectors. A mean of them deviates from its own by s / sqrt(n), a covariance by the square
// root of (s_rr s_cc + s_rc^2) / n; six times that happens once in 10^9 tests.
template <matrix_layout layout, typename Method>
void expect_law() {
  constexpr std::size_t d = 3;
  constexpr std::size_t n = 200000;
  auto engine = philox_case::make();
  const auto x = draw(some_vectors<double, layout, Method>(d), engine, n, d);
  const std::vector<double> mean = some_means<double>(d);
  const auto factor = [](std::size_t r, std::size_t c) {
    const bool there = layout == matrix_layout::diagonal ? c == r : c <= r;
    return there ? entry<double>(r, c) : 0.0;
  };
  const auto covariance = [&factor](std::size_t r, std::size_t c) {
    double sum = 0;
    for (std::size_t i = 0; i < d; ++i) {
      sum += factor(r, i) * factor(c, i);
    }
    return sum;
  };
  for (std::size_t r = 0; r < d; ++r) {
    double total = 0;
    std::vector<double> products(d);
    for (std::size_t v = 0; v < n; ++v) {
      const double* vector = x.data() + v * d;
      total += vector[r] - mean[r];
      for (std::size_t c = 0; c < d; ++c) {
        products[c] += (vector[r] - mean[r]) * (vector[c] - mean[c]);
      }
    }
    EXPECT_NEAR(total / n, 0, 6 * std::sqrt(covariance(r, r) / n)) << r;
    for (std::size_t c = 0; c < d; ++c) {
      const double spread = covariance(r, r) * covariance(c, c) + std::pow(covariance(r, c), 2);
      EXPECT_NEAR(products[c] / n, covariance(r, c), 6 * std::sqrt(spread / n)) << r << ' ' << c;
    }
  }
}

TEST(gaussian_mv_on_a_gpu, vectors_have_the_mean_and_the_covariance_of_the_factor) {
  expect_law<matrix_layout::full, method::icdf>();
  expect_law<matrix_layout::packed, method::box_muller2>();
  expect_law<matrix_layout::packed, method::box_muller>();
  expect_law<matrix_layout::diagonal, method::icdf>();
}

TARN_REPORTS_CUDA(gaussian_mv)

}  // namespace
