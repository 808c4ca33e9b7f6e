// SPDX-License-Identifier: Apache-2.0
// The kernel functors of the families with a closed inverse, called as plain functions: against
// their formulas in long double, at the edges, and what reaches them of the public parameters.
// Tolerances: a logarithm, root, power or tangent of the host's library errs by less than one unit
// in the last place, the multiply-add by half a unit of the larger of its sum and its addend.
#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>

#include <gtest/gtest.h>

#include "distributions/inverse_cdf.hpp"
#include "formula_support.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using rng::detail::device_type;
using rng::detail::distribution_impl;
using tarn_test::canonical_reals;
using tarn_test::expect_within;

template <typename R>
struct closed_form : testing::Test {
  static constexpr long double log_zero =
      std::is_same_v<R, float> ? -103.278931L : -744.44007192138122L;
  static constexpr R nan = std::numeric_limits<R>::quiet_NaN();
  static constexpr R above_one = 1 + std::numeric_limits<R>::epsilon();
  static long double log_of(R u) { return std::log(static_cast<long double>(u)); }
};
using real_types = testing::Types<float, double>;
TYPED_TEST_SUITE(closed_form, real_types);

/// functor(u) against place + spread * standard(u), whose standard variate errs by `units`.
template <typename R, typename Functor, typename Standard>
void expect_formula(const Functor& functor, R place, R spread, const Standard& standard) {
  const gpu::real_range<R> range = functor.range();
  const auto reals = canonical_reals(range.lo, range.hi);
  ASSERT_GT(reals.size(), 10000u);
  for (std::size_t i = 0; i + 4 <= reals.size(); i += 4) {
    const auto values =
        functor(sycl::vec<R, 4>(reals[i], reals[i + 1], reals[i + 2], reals[i + 3]));
    for (int k = 0; k < 4; ++k) {
      const R u = reals[i + static_cast<std::size_t>(k)];
      const auto [z, error] = standard(u);  // in long double; error of z in units of R
      const long double product = static_cast<long double>(spread) * z;
      const long double scale = std::fmax(std::fabs(product), std::fabs(place + product));
      ASSERT_NO_FATAL_FAILURE(expect_within<R>(values[k], place + product, error + 0.5L, scale))
          << static_cast<double>(u);
    }
  }
}

struct variate {
  long double value;
  long double units;
};

TYPED_TEST(closed_form, exponential_is_minus_the_logarithm) {
  using R = TypeParam;
  // One unit of the logarithm is up to two of the product, whose mantissa may be smaller.
  const auto standard = [](R u) { return variate{-TestFixture::log_of(u), 2}; };
  expect_formula<R>(gpu::exponential_icdf<R>{0, 1, 0, 1, 0}, 0, 1, standard);
  expect_formula<R>(gpu::exponential_icdf<R>{R(-1.5), R(2.75), 0, 1, 0}, R(-1.5), R(2.75),
                    standard);
  expect_formula<R>(gpu::exponential_icdf<R>{R(-1.5), R(2.75), 0, 1, 1}, R(-1.5), R(2.75),
                    standard);
}

TYPED_TEST(closed_form, exponential_of_zero_takes_the_stand_in_of_its_logarithm) {
  using R = TypeParam;
  const R a = 3;
  const R beta = R(0.5);
  const R expected = static_cast<R>(3 - 0.5L * TestFixture::log_zero);
  EXPECT_EQ((gpu::exponential_icdf<R>{a, beta, 0, 1, 0}.one(0)), expected);
  EXPECT_EQ((gpu::exponential_icdf<R>{a, beta, 0, 1, 1}.one(0)), expected);
  EXPECT_EQ((gpu::exponential_icdf<R>{a, beta, 0, 1, 0}.one(1)), a);
}

TYPED_TEST(closed_form, accurate_keeps_results_from_falling_below_a) {
  using R = TypeParam;
  const R u = TestFixture::above_one;  // only here is the logarithm positive
  const R a = R(-0.25);
  EXPECT_LT((gpu::exponential_icdf<R>{a, 2, 0, 1, 0}.one(u)), a);
  EXPECT_EQ((gpu::exponential_icdf<R>{a, 2, 0, 1, 1}.one(u)), a);
  // A negative spread stands for whatever brings the others below.
  EXPECT_LT((gpu::rayleigh_icdf<R>{a, -2, 0, 1, 0}.one(R(0.5))), a);
  EXPECT_EQ((gpu::rayleigh_icdf<R>{a, -2, 0, 1, 1}.one(R(0.5))), a);
  EXPECT_LT((gpu::weibull_icdf<R>{2, a, -2, 0, 1, 0}.one(R(0.5))), a);
  EXPECT_EQ((gpu::weibull_icdf<R>{2, a, -2, 0, 1, 1}.one(R(0.5))), a);
}

TYPED_TEST(closed_form, weibull_has_alpha_itself_as_exponent) {
  using R = TypeParam;
  for (const R alpha : {R(0.5), R(1.75), R(3)}) {
    // The logarithm's unit grows by the exponent.
    const auto standard = [alpha](R u) {
      return variate{std::pow(-TestFixture::log_of(u), static_cast<long double>(alpha)),
                     2 + 2 * static_cast<long double>(alpha)};
    };
    expect_formula<R>(gpu::weibull_icdf<R>{alpha, 0, 1, 0, 1, 0}, 0, 1, standard);
    expect_formula<R>(gpu::weibull_icdf<R>{alpha, R(-1.5), R(0.75), 0, 1, 1}, R(-1.5), R(0.75),
                      standard);
  }
}

TYPED_TEST(closed_form, weibull_of_shape_one_is_exponential) {
  using R = TypeParam;
  for (const R u : canonical_reals<R>(0, 1)) {
    ASSERT_EQ((gpu::weibull_icdf<R>{1, R(0.5), 3, 0, 1, 0}.one(u)),
              (gpu::exponential_icdf<R>{R(0.5), 3, 0, 1, 0}.one(u)));
  }
  EXPECT_EQ((gpu::weibull_icdf<R>{1, 0, 1, 0, 1, 0}.one(0)),
            static_cast<R>(-TestFixture::log_zero));
  EXPECT_EQ((gpu::weibull_icdf<R>{R(1.5), 7, 1, 0, 1, 0}.one(1)), 7);
}

TYPED_TEST(closed_form, rayleigh_is_the_root_without_a_factor) {
  using R = TypeParam;
  const auto standard = [](R u) { return variate{std::sqrt(-TestFixture::log_of(u)), 3}; };
  expect_formula<R>(gpu::rayleigh_icdf<R>{0, 1, 0, 1, 0}, 0, 1, standard);
  expect_formula<R>(gpu::rayleigh_icdf<R>{R(-1), R(2.5), 0, 1, 1}, R(-1), R(2.5), standard);
  EXPECT_EQ((gpu::rayleigh_icdf<R>{0, 1, 0, 1, 0}.one(0)),
            static_cast<R>(std::sqrt(-TestFixture::log_zero)));
  EXPECT_EQ((gpu::rayleigh_icdf<R>{4, 1, 0, 1, 0}.one(1)), 4);
}

TYPED_TEST(closed_form, gumbel_is_the_logarithm_of_the_logarithm) {
  using R = TypeParam;
  // A unit of the inner logarithm is a unit of 1 in the outer one, however small that is.
  const auto standard = [](R u) {
    const long double w = std::log(-TestFixture::log_of(u));
    const long double unit = tarn_test::spacing<R>(w);
    return variate{w, 2 + tarn_test::spacing<R>(1) / unit};
  };
  expect_formula<R>(gpu::gumbel_icdf<R>{0, 1}, 0, 1, standard);
  expect_formula<R>(gpu::gumbel_icdf<R>{R(-1), R(2.5)}, R(-1), R(2.5), standard);
}

TYPED_TEST(closed_form, gumbel_has_a_stand_in_at_both_ends) {
  using R = TypeParam;
  const gpu::gumbel_icdf<R> standard{0, 1};
  EXPECT_EQ(standard.one(0), std::log(static_cast<R>(-TestFixture::log_zero)));
  EXPECT_EQ(standard.one(1), static_cast<R>(TestFixture::log_zero));
  EXPECT_EQ((gpu::gumbel_icdf<R>{2, R(0.5)}.one(1)),
            static_cast<R>(2 + 0.5L * TestFixture::log_zero));
}

TYPED_TEST(closed_form, cauchy_is_the_tangent) {
  using R = TypeParam;
  const auto standard = [](R u) { return variate{std::tan(static_cast<long double>(u)), 2}; };
  expect_formula<R>(gpu::cauchy_icdf<R>{0, 1}, 0, 1, standard);
  expect_formula<R>(gpu::cauchy_icdf<R>{R(-1), R(2.5)}, R(-1), R(2.5), standard);
}

TEST(cauchy, ranges_are_the_halves_of_pi_as_the_type_has_them) {
  const auto single = gpu::cauchy_icdf<float>{0, 1}.range();
  EXPECT_EQ(sycl::bit_cast<std::uint32_t>(single.lo), 0xBFC90FDBu);
  EXPECT_EQ(sycl::bit_cast<std::uint32_t>(single.hi), 0x3FC90FDBu);
  const auto wide = gpu::cauchy_icdf<double>{0, 1}.range();
  EXPECT_EQ(wide.lo, -1.5707963267948966);
  EXPECT_EQ(wide.hi, 1.5707963267948966);
  // The float is past the pole, the double before it.
  EXPECT_GT((gpu::cauchy_icdf<float>{0, 1}.one(single.lo)), 2e7f);
  EXPECT_LT((gpu::cauchy_icdf<double>{0, 1}.one(wide.lo)), -1.6e16);
}

TYPED_TEST(closed_form, laplace_takes_distance_and_side_of_a_pair) {
  using R = TypeParam;
  const gpu::laplace_icdf<R> functor{R(-1), R(2.5)};
  const auto distances = canonical_reals<R>(0, 1);
  for (const R u0 : distances) {
    const long double distance = -2.5L * TestFixture::log_of(u0);
    R left, right;
    functor.pair(u0, R(0.75), &left);
    functor.pair(u0, R(0.25), &right);
    const auto scale = [&](long double x) { return std::fmax(distance, std::fabs(x)); };
    ASSERT_NO_FATAL_FAILURE(expect_within<R>(left, -1 - distance, 2.5L, scale(-1 - distance)));
    ASSERT_NO_FATAL_FAILURE(expect_within<R>(right, -1 + distance, 2.5L, scale(-1 + distance)));
  }
}

TYPED_TEST(closed_form, laplace_puts_the_half_to_the_right_and_no_number_to_the_left) {
  using R = TypeParam;
  const gpu::laplace_icdf<R> functor{10, 1};
  const auto side = [&](R u1) {
    R value;
    functor.pair(R(0.5), u1, &value);
    return value > 10 ? 1 : value < 10 ? -1 : 0;
  };
  EXPECT_EQ(side(R(0.5)), 1);
  EXPECT_EQ(side(std::nextafter(R(0.5), R(1))), -1);
  EXPECT_EQ(side(std::nextafter(R(0.5), R(0))), 1);
  EXPECT_EQ(side(TestFixture::nan), -1);
  R value;
  functor.pair(0, 0, &value);
  EXPECT_EQ(value, static_cast<R>(10 - TestFixture::log_zero));
  // Pairs in the order of the four, one result each.
  const auto values = functor(sycl::vec<R, 4>(1, 0, R(0.5), 1));
  static_assert(decltype(values)::size() == 2);
  EXPECT_EQ(values[0], 10);
  EXPECT_LT(values[1], 10);
}

template <typename T, template <typename, typename> class Family, typename Method, typename... A>
auto functor_of(A... parameters) {
  return distribution_impl<T, Family<T, Method>, device_type::gpu>(Family<T, Method>(parameters...))
      .kernel;
}

/// Three numbers of a record: two parameters or the range, and the byte where there is one.
template <typename R>
void expect_two_then_range(const R& x, const R& y, const R& lo, const R& hi) {
  EXPECT_EQ(x, R(0.25));
  EXPECT_EQ(y, R(4));
  EXPECT_EQ(lo, R(0));
  EXPECT_EQ(hi, R(1));
}

TYPED_TEST(closed_form, records_are_the_parameters_then_the_range_then_the_byte) {
  using R = TypeParam;
  using exponential = rng::exponential_method::icdf;
  using exponential_accurate = rng::exponential_method::icdf_accurate;
  using rayleigh = rng::rayleigh_method::icdf;
  using rayleigh_accurate = rng::rayleigh_method::icdf_accurate;
  const auto check = [](const auto& functor, int byte) {
    static_assert(std::is_trivially_copyable_v<std::decay_t<decltype(functor)>>);
    const auto& [x, y, lo, hi, accurate] = functor;
    expect_two_then_range<R>(x, y, lo, hi);
    static_assert(std::is_same_v<std::decay_t<decltype(accurate)>, std::uint8_t>);
    EXPECT_EQ(accurate, byte);
  };
  check(functor_of<R, rng::exponential, exponential>(R(0.25), R(4)), 0);
  check(functor_of<R, rng::exponential, exponential_accurate>(R(0.25), R(4)), 1);
  check(functor_of<R, rng::rayleigh, rayleigh>(R(0.25), R(4)), 0);
  check(functor_of<R, rng::rayleigh, rayleigh_accurate>(R(0.25), R(4)), 1);
  const auto check_plain = [](const auto& functor) {
    static_assert(std::is_trivially_copyable_v<std::decay_t<decltype(functor)>>);
    const auto& [x, y, lo, hi] = functor;
    expect_two_then_range<R>(x, y, lo, hi);
  };
  check_plain(functor_of<R, rng::gumbel, rng::gumbel_method::icdf>(R(0.25), R(4)));
  check_plain(functor_of<R, rng::laplace, rng::laplace_method::icdf>(R(0.25), R(4)));
  const auto& [a, b, lo, hi] = functor_of<R, rng::cauchy, rng::cauchy_method::icdf>(R(0.25), R(4));
  expect_two_then_range<R>(a, b, 0, 1);
  EXPECT_EQ(lo, -hi);
}

TYPED_TEST(closed_form, the_record_of_weibull_begins_with_the_shape) {
  using R = TypeParam;
  const auto check = [](const auto& functor, int byte) {
    const auto& [alpha, a, beta, lo, hi, accurate] = functor;
    EXPECT_EQ(alpha, R(1.5));
    expect_two_then_range<R>(a, beta, lo, hi);
    EXPECT_EQ(accurate, byte);
  };
  check(functor_of<R, rng::weibull, rng::weibull_method::icdf>(R(1.5), R(0.25), R(4)), 0);
  check(functor_of<R, rng::weibull, rng::weibull_method::icdf_accurate>(R(1.5), R(0.25), R(4)), 1);
}

}  // namespace
