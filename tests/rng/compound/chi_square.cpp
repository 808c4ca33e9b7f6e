// SPDX-License-Identifier: Apache-2.0
// chi_square on GPU queues: which road a count of degrees takes, each against the variates that it
// is made of, and that the kernels behind them keep to what a call has, also where its count is no
// multiple of the four results of a work-item.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "distributions/chi_square_gpu_device.hpp"
#include "drawing.hpp"
#include "gamma_support.hpp"
#include "level_calls.hpp"
#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using tarn_test::both_forms;
using tarn_test::draw;
using tarn_test::draw_at_level;
using tarn_test::host_run_gpu_queue;
using tarn_test::marker;
using tarn_test::same_bits;

constexpr std::uint32_t seed = 31;
/// Whole blocks, parts of one, and more than a work-group.
constexpr std::int64_t counts[] = {0, 1, 2, 3, 4, 5, 7, 8, 1001, 1003};

template <typename T>
using chi_square_road = tarn_test::of_reals<T>;
TYPED_TEST_SUITE(chi_square_road, tarn_test::real_types);

/// `each` variates of `distr` for one result, as the same engine gives them.
template <typename Distr>
auto ingredients(const Distr& distr, std::int32_t each, std::int64_t n) {
  rng::philox4x32x10 engine(host_run_gpu_queue(), seed);
  return draw(distr, engine, each * n);
}

template <typename T, typename Fold>
std::vector<T> folded(const std::vector<T>& variates, std::size_t each, const Fold& fold) {
  std::vector<T> results;
  for (std::size_t i = 0; i < variates.size(); i += each) {
    results.push_back(
        fold(std::vector<T>(variates.begin() + static_cast<std::ptrdiff_t>(i),
                            variates.begin() + static_cast<std::ptrdiff_t>(i + each))));
  }
  return results;
}

template <typename T>
T sum_of_squares(const std::vector<T>& normals) {
  T sum = 0;
  for (const T x : normals) {
    sum = std::fma(x, x, sum);
  }
  return sum;
}

template <typename T>
T minus_twice_log(const std::vector<T>& uniforms) {
  T product = 1;
  for (const T u : uniforms) {
    product *= u;
  }
  return -2 * std::log(product);
}

template <typename T>
void expect_call(std::int32_t df, std::int64_t n, const std::vector<T>& values,
                 std::int64_t consumed) {
  SCOPED_TRACE(testing::Message() << df << " degrees, n = " << n);
  for (const auto form : both_forms) {
    rng::philox4x32x10 engine(host_run_gpu_queue(), seed);
    const auto got =
        draw_at_level(form, rng::chi_square<T>(df), engine, n, static_cast<std::size_t>(n));
    EXPECT_EQ(got.values, values);
    EXPECT_EQ(got.consumed, consumed);
  }
}

TYPED_TEST(chi_square_road, one_and_three_degrees_are_squares_of_normals_by_inversion) {
  using T = TypeParam;
  for (const std::int32_t df : {1, 3}) {
    for (const std::int64_t n : counts) {
      const auto normals = ingredients(rng::gaussian<T, rng::gaussian_method::icdf>(0, 1), df, n);
      expect_call(df, n, folded(normals, static_cast<std::size_t>(df), sum_of_squares<T>), df * n);
    }
  }
}

TYPED_TEST(chi_square_road, even_degrees_up_to_sixteen_are_logarithms_of_products) {
  using T = TypeParam;
  for (const std::int32_t df : {2, 4, 6, 16}) {
    const std::int32_t half = df / 2;
    for (const std::int64_t n : counts) {
      const auto uniforms = ingredients(rng::uniform<T>(0, 1), half, n);
      expect_call(df, n, folded(uniforms, static_cast<std::size_t>(half), minus_twice_log<T>),
                  half * n);
    }
  }
}

TYPED_TEST(chi_square_road, other_degrees_are_twice_a_gamma_number_of_half_of_them) {
  using T = TypeParam;
  for (const std::int32_t df : {5, 7, 15, 17, 18, 1000, std::numeric_limits<std::int32_t>::max()}) {
    for (const std::int64_t n : {1, 6, 1003}) {
      rng::philox4x32x10 engine(host_run_gpu_queue(), seed);
      const rng::gamma<T> gamma(static_cast<T>(df) / 2, 0, 2);
      const auto twice = draw_at_level(tarn_test::output_form::pointer, gamma, engine, n,
                                       static_cast<std::size_t>(n));
      expect_call(df, n, twice.values, twice.consumed);
    }
  }
}

TYPED_TEST(chi_square_road, the_engine_stands_behind_the_words_taken) {
  using T = TypeParam;
  const rng::bits<> bits;
  for (const std::int32_t df : {1, 2, 3, 5, 16, 17}) {
    rng::philox4x32x10 engine(host_run_gpu_queue(), seed), skipped(host_run_gpu_queue(), seed);
    const auto got =
        draw_at_level(tarn_test::output_form::pointer, rng::chi_square<T>(df), engine, 13, 13);
    rng::skip_ahead(skipped, static_cast<std::uint64_t>(got.consumed));
    EXPECT_EQ(draw(bits, engine, 5), draw(bits, skipped, 5)) << df << " degrees";
  }
}

TYPED_TEST(chi_square_road, a_uniform_of_zero_takes_the_stand_in_of_its_logarithm) {
  using T = TypeParam;
  // This block of the cipher with an all-zero key begins with the word 2^31, least as a signed one.
  const auto at_zero = [] {
    return tarn_test::philox_at(host_run_gpu_queue(), {0, 0}, {2047882832, 0, 0, 0});
  };
  auto words = at_zero();
  ASSERT_EQ(draw(rng::uniform<T>(0, 1), words, 1)[0], 0);
  for (const std::int32_t df : {2, 4, 16}) {
    auto engine = at_zero();
    EXPECT_EQ(draw(rng::chi_square<T>(df), engine, 1)[0], -2 * TestFixture::log_zero) << df;
  }
}

/// The kernel of either road on scratch memory of no more than `each` variates a result: the
/// address sanitizer tells of a read behind it.
template <typename T, typename Kernel>
void expect_within_bounds(std::int32_t each, const Kernel& kernel) {
  sycl::queue queue = host_run_gpu_queue();
  constexpr std::size_t guard = 16;
  for (std::size_t n = 0; n <= 9; ++n) {
    const std::size_t count = n * static_cast<std::size_t>(each);
    T* scratch = sycl::malloc_shared<T>(std::max<std::size_t>(count, 1), queue);
    T* out = sycl::malloc_shared<T>(n + guard, queue);
    std::fill_n(scratch, count, T(0.5));
    std::fill_n(out, n + guard, marker<T>());
    kernel(queue, static_cast<std::int64_t>(n), each, scratch, out);
    EXPECT_TRUE(std::none_of(out, out + n, [](T x) { return same_bits(x, marker<T>()); })) << n;
    EXPECT_TRUE(std::all_of(out + n, out + n + guard, [](T x) {
      return same_bits(x, marker<T>());
    })) << n;
    EXPECT_TRUE(std::all_of(out, out + n, [&](T x) { return x == out[0]; })) << n;
    sycl::free(out, queue);
    sycl::free(scratch, queue);
  }
}

TYPED_TEST(chi_square_road, kernels_write_the_results_of_the_call_and_nothing_else) {
  using T = TypeParam;
  for (const std::int32_t df : {1, 3}) {
    expect_within_bounds<T>(df, [](auto& queue, auto n, auto each, const T* scratch, T* out) {
      gpu::chi_square_gauss_post_process<T, T*>(queue, n, each, scratch, out).wait_and_throw();
    });
  }
  for (const std::int32_t half : {1, 5, 8}) {
    expect_within_bounds<T>(half, [](auto& queue, auto n, auto each, const T* scratch, T* out) {
      gpu::chi_square_ln_post_process<T, T*>(queue, n, each, scratch, out).wait_and_throw();
    });
  }
}

TYPED_TEST(chi_square_road, a_product_that_underflows_stays_finite) {
  using T = TypeParam;
  sycl::queue queue = host_run_gpu_queue();
  T* memory = sycl::malloc_shared<T>(3, queue);
  memory[0] = memory[1] = std::numeric_limits<T>::min();
  memory[2] = marker<T>();
  gpu::chi_square_ln_post_process<T, T*>(queue, 1, 2, memory, memory + 2).wait_and_throw();
  EXPECT_EQ(memory[2], -2 * TestFixture::log_zero);
  sycl::free(memory, queue);
}

TYPED_TEST(chi_square_road, a_buffer_of_exactly_the_results_is_enough) {
  using T = TypeParam;
  for (const std::int32_t df : {1, 2, 3, 16, 5}) {
    for (const std::int64_t n : {1, 2, 3, 5}) {
      rng::philox4x32x10 engine(host_run_gpu_queue(), seed), other(host_run_gpu_queue(), seed);
      std::vector<T> values(static_cast<std::size_t>(n), marker<T>());
      {
        sycl::buffer<T, 1> buffer(values.data(), sycl::range<1>(values.size()));
        rng::generate(rng::chi_square<T>(df), engine, n, buffer);
      }
      EXPECT_EQ(values, draw(rng::chi_square<T>(df), other, n));
    }
  }
}

}  // namespace
