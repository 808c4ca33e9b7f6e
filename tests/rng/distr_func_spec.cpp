// SPDX-License-Identifier: Apache-2.0
// The kernel of pairs over generated words, on words of mt19937 that are drawn beforehand: bit for
// bit what its functor makes of each pair, and what the host draws from the same seed.
#include "frame/distr_func_spec.hpp"

#include <cmath>
#include <cstdint>
#include <vector>

#include <gtest/gtest.h>

#include "distributions/gaussian.hpp"
#include "distributions/inverse_cdf.hpp"
#include "drawing.hpp"
#include "formula_support.hpp"
#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using rng::detail::device_type;
using rng::detail::distribution_impl;
using rng::detail::launch_distr_func_spec;
using tarn_test::guard_size;
using tarn_test::marker;
using tarn_test::same_bits;

constexpr std::uint32_t seed = 4321;

std::vector<std::uint32_t> words_of_mt19937(std::int64_t n) {
  rng::mt19937 engine(tarn_test::cpu_queue(), seed);
  return tarn_test::draw(rng::bits<>(), engine, n);
}

template <typename Distr>
auto functor_of(const Distr& distr) {
  return distribution_impl<typename Distr::result_type, Distr, device_type::gpu>(distr).kernel;
}

/// n results through pointers, with guards behind them.
template <typename T, typename Functor>
std::vector<T> through_pointers(sycl::queue queue, const Functor& functor,
                                const std::vector<std::uint32_t>& drawn, std::int64_t n) {
  const auto count = static_cast<std::size_t>(n);
  auto* words = sycl::malloc_shared<std::uint32_t>(drawn.size(), queue);
  T* results = sycl::malloc_shared<T>(count + guard_size, queue);
  std::copy(drawn.begin(), drawn.end(), words);
  std::fill(results, results + count + guard_size, marker<T>());
  queue
      .submit([&](sycl::handler& group) {
        const std::uint32_t* from = words;
        launch_distr_func_spec<T>(group, from, n, results, functor);
      })
      .wait_and_throw();
  for (std::size_t i = count; i < count + guard_size; ++i) {
    EXPECT_TRUE(same_bits(results[i], marker<T>())) << "stray store at " << i << " of " << n;
  }
  std::vector<T> values(results, results + count);
  sycl::free(words, queue);
  sycl::free(results, queue);
  return values;
}

/// The same from a buffer into a buffer.
template <typename T, typename Functor>
std::vector<T> through_buffers(sycl::queue queue, const Functor& functor,
                               std::vector<std::uint32_t> drawn, std::int64_t n) {
  std::vector<T> values(static_cast<std::size_t>(n) + guard_size, marker<T>());
  {
    sycl::buffer<std::uint32_t, 1> words(drawn.data(), sycl::range<1>(drawn.size()));
    sycl::buffer<T, 1> results(values.data(), sycl::range<1>(values.size()));
    queue.submit([&](sycl::handler& group) {
      const sycl::accessor<std::uint32_t, 1, sycl::access_mode::read> from(words, group);
      launch_distr_func_spec<T>(group, from, n, results, functor);
    });
  }
  for (std::size_t i = static_cast<std::size_t>(n); i < values.size(); ++i) {
    EXPECT_TRUE(same_bits(values[i], marker<T>())) << "stray store at " << i << " of " << n;
  }
  values.resize(static_cast<std::size_t>(n));
  return values;
}

template <typename Distr>
void expect_functor_on_each_pair(const Distr& distr) {
  using T = typename Distr::result_type;
  const auto functor = functor_of(distr);
  constexpr int step = decltype(functor)::pair_results;
  for (const std::int64_t n : {1, 2, 3, 7, 8, 1001, 20000}) {
    const std::int64_t pairs = (n + step - 1) / step;
    const auto drawn = words_of_mt19937(2 * pairs);
    std::vector<T> expected;
    for (std::size_t i = 0; i < drawn.size(); i += 2) {
      T values[step];
      functor.pair(static_cast<T>(drawn[i]) * static_cast<T>(0x1p-32),
                   static_cast<T>(drawn[i + 1]) * static_cast<T>(0x1p-32), values);
      expected.insert(expected.end(), values, values + step);
    }
    expected.resize(static_cast<std::size_t>(n));
    for (const sycl::queue& queue : tarn_test::gpu_queues()) {
      const auto results = through_pointers<T>(queue, functor, drawn, n);
      ASSERT_TRUE(tarn_test::same_reals(queue, results, expected)) << n;
      ASSERT_EQ(through_buffers<T>(queue, functor, drawn, n), results) << n;
    }
  }
}

/// Units in the last place of the host's results, which follow an error of the normal within it
/// times `steepness(value)`.
template <typename Distr, typename Steepness>
void expect_host(const Distr& distr, const Steepness& steepness) {
  using T = typename Distr::result_type;
  constexpr std::int64_t n = 20000;
  rng::mt19937 engine(tarn_test::cpu_queue(), seed);
  const auto host = tarn_test::draw(distr, engine, n);
  for (const sycl::queue& queue : tarn_test::gpu_queues()) {
    const auto device = through_pointers<T>(queue, functor_of(distr), words_of_mt19937(2 * n), n);
    for (std::size_t i = 0; i < host.size(); ++i) {
      ASSERT_NO_FATAL_FAILURE(
          tarn_test::expect_within<T>(device[i], host[i], 4 * steepness(host[i]), host[i]))
          << i;
    }
  }
}

template <typename R>
struct pairs_of_words : testing::Test {};
TARN_REPORTS_CUDA(pairs_of_words)
using real_types = testing::Types<float, double>;
TYPED_TEST_SUITE(pairs_of_words, real_types);

TYPED_TEST(pairs_of_words, are_what_the_functor_makes_of_them) {
  using R = TypeParam;
  expect_functor_on_each_pair(rng::gaussian<R, rng::gaussian_method::box_muller>(R(-3), R(2)));
  expect_functor_on_each_pair(rng::gaussian<R, rng::gaussian_method::box_muller2>(R(-3), R(2)));
  expect_functor_on_each_pair(
      rng::lognormal<R, rng::lognormal_method::box_muller2>(R(0.5), R(0.25), R(-3), R(2)));
  expect_functor_on_each_pair(rng::laplace<R>(R(-1), R(2.5)));
}

TYPED_TEST(pairs_of_words, agree_with_the_host) {
  using R = TypeParam;
  const auto plain = [](long double) { return 1.0L; };
  expect_host(rng::gaussian<R, rng::gaussian_method::box_muller>(), plain);
  expect_host(rng::gaussian<R, rng::gaussian_method::box_muller2>(), plain);
  expect_host(rng::laplace<R>(), plain);
  // The exponential turns an absolute error of y into a relative one.
  expect_host(rng::lognormal<R, rng::lognormal_method::box_muller2>(),
              [](long double x) { return std::fmax(1.0L, std::fabs(std::log(x))); });
}

}  // namespace
