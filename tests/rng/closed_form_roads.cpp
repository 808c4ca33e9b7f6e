// SPDX-License-Identifier: Apache-2.0
// The host road and the device road of every distribution with a formula: the same canonical reals
// of the same words, so that results part by what the elementary functions of both err: four units
// in the last place of the standard variate z of a family, whose parameters are those by default.
// The program prints the largest differences.
//
// Placing z takes up to one and a half places more, as the host rounds product and sum and the
// device rounds once. Where place and product cancel, the last place of the result says nothing of
// either: there the unit is that of the product.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "formula_support.hpp"
#include "frame/rows.hpp"
#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using tarn_test::draw;
using tarn_test::spacing;

/// Parameters of a row on both roads: those by default, and others. No case: no formula.
template <typename Distr>
struct road_case {
  static constexpr bool there = false;
};

template <typename T>
struct of_place_and_spread {
  static constexpr bool there = true;
  static constexpr T place = T(-1.5);
  static constexpr T spread = T(2.75);
};

/// What a result may be off by: four times what `z_error` amounts to behind the product with
/// `slope`, and `roundings` in the last place of the sum or of the product.
template <typename T>
long double allowed(long double x, long double product, long double z_error, long double slope,
                    long double roundings) {
  const long double last = spacing<T>(std::fmax(std::fabs(x), std::fabs(product)));
  return 4 * z_error * std::fabs(slope) + roundings * last;
}

// allowance(x, other): what a result x may be off by; z is its standard variate, whose error is
// given.
#define TARN_PLACED(family, ...)                                           \
  template <typename T, typename Method>                                   \
  struct road_case<rng::family<T, Method>> : of_place_and_spread<T> {      \
    using distr = rng::family<T, Method>;                                  \
    static distr host(bool other) {                                        \
      return other ? distr(road_case::place, road_case::spread) : distr(); \
    }                                                                      \
    static distr device(bool other) { return host(other); }                \
    static long double allowance(long double x, bool other) {              \
      const long double product = other ? x - road_case::place : x;        \
      const long double slope = other ? road_case::spread : 1;             \
      const long double z = product / slope;                               \
      return allowed<T>(x, product, __VA_ARGS__, slope, other ? 1.5L : 0); \
    }                                                                      \
  };
TARN_PLACED(gaussian, spacing<T>(z))
TARN_PLACED(exponential, spacing<T>(z))
TARN_PLACED(rayleigh, spacing<T>(z))
TARN_PLACED(laplace, spacing<T>(z))
TARN_PLACED(cauchy, spacing<T>(z))
// ln(-ln u) next to u = 1/e: the inner logarithm is there next to 1, and its last place is that of
// 1 in the outer one, which goes through 0.
TARN_PLACED(gumbel, std::fmax(spacing<T>(1), spacing<T>(z)))

/// exp(y) with a y of four units makes relative errors of the size of y; the exponentials of both
/// roads add a unit each.
template <typename T, typename Method>
struct road_case<rng::lognormal<T, Method>> {
  static constexpr bool there = true;
  using distr = rng::lognormal<T, Method>;
  static constexpr bool turned =
      std::is_same_v<Method, rng::lognormal_method::box_muller2_accurate>;
  // Drawn by inversion on a device, and on purpose.
  using on_host =
      rng::lognormal<T, std::conditional_t<turned, rng::lognormal_method::icdf, Method>>;

  template <typename Distr>
  static Distr made(bool other) {
    return other ? Distr(T(0.5), T(0.25), T(-3), T(2)) : Distr();
  }
  static on_host host(bool other) { return made<on_host>(other); }
  static distr device(bool other) { return made<distr>(other); }
  static long double allowance(long double x, bool other) {
    const long double product = other ? x + 3 : x;
    const long double y = std::log(product / (other ? 2 : 1));
    const long double z_part = other ? y - 0.5L : y;
    const long double y_error = std::fmax(spacing<T>(y), spacing<T>(z_part));
    return allowed<T>(x, product, y_error, product, other ? 3.5L : 2);
  }
};

/// The host's exponent is 1 / alpha, the device's alpha. The host's power is exp(w) with w a
/// logarithm times the exponent: relative errors of the size of w and of the inner logarithm's.
template <typename T, typename Method>
struct road_case<rng::weibull<T, Method>> : of_place_and_spread<T> {
  using distr = rng::weibull<T, Method>;
  static distr made(T alpha, bool other) {
    return other ? distr(alpha, road_case::place, road_case::spread) : distr();
  }
  static distr host(bool other) { return made(2, other); }
  static distr device(bool other) { return made(T(0.5), other); }
  static long double allowance(long double x, bool other) {
    const long double product = other ? x - road_case::place : x;
    const long double w = std::log(product / (other ? road_case::spread : 1));
    const long double w_error = std::fmax(spacing<T>(1), spacing<T>(w));
    return allowed<T>(x, product, w_error, product, other ? 3.5L : 2);
  }
};

template <typename Engine>
Engine engine_at(const sycl::queue& queue, std::uint64_t first) {
  if constexpr (std::is_same_v<Engine, rng::mt2203>) {  // one generator, and no skips
    Engine engine(queue, 77, 5);
    draw(rng::bits<>(), engine, static_cast<std::int64_t>(first));
    return engine;
  } else {
    Engine engine(queue, 77);
    rng::skip_ahead(engine, first);
    return engine;
  }
}

struct difference {
  double places = 0;      // in the last place of the results
  double share = 0;       // of what is allowed
  std::size_t count = 0;  // results that are not the same
};

template <typename Engine, typename Distr>
difference largest_difference(bool other) {
  using at = road_case<Distr>;
  difference largest;
  // Groups of mt19937 pass over each other's words: long calls take long.
  constexpr std::int64_t most = std::is_same_v<Engine, rng::mt19937> ? 20001 : 200001;
  for (const std::int64_t n :
       {std::int64_t{1}, std::int64_t{2}, std::int64_t{5}, std::int64_t{1023}, most}) {
    for (const std::uint64_t first : {0u, 3u}) {
      auto host_engine = engine_at<Engine>(tarn_test::cpu_queue(), first);
      auto device_engine = engine_at<Engine>(tarn_test::gpu_queue(), first);
      const auto host = draw(at::host(other), host_engine, n);
      const auto device = draw(at::device(other), device_engine, n);
      for (std::size_t i = 0; i < host.size(); ++i) {
        using T = typename Distr::result_type;
        const long double apart = std::fabs(static_cast<long double>(host[i]) - device[i]);
        EXPECT_TRUE(std::isfinite(apart)) << host[i] << ' ' << device[i];
        largest.places = std::max(largest.places, static_cast<double>(apart / spacing<T>(host[i])));
        if (apart != 0) {  // where both are at their place there may be no allowance
          const auto share = static_cast<double>(apart / at::allowance(host[i], other));
          EXPECT_FALSE(std::isnan(share)) << host[i] << ' ' << device[i];
          largest.share = std::max(largest.share, share);
        }
        largest.count += apart != 0 ? 1 : 0;
      }
    }
  }
  return largest;
}

template <typename Engine, typename Distr>
void compare_row(const char* family, const char* result, const char* method, int& rows) {
  if constexpr (road_case<Distr>::there) {
    ++rows;
    for (const bool other : {false, true}) {
      const difference largest = largest_difference<Engine, Distr>(other);
      std::printf(
          "%-14s %-11s %-6s %-20s %-8s %10.2f places, %4.2f of what is allowed; %zu differ\n",
          rng::detail::engine_row<Engine>::name, family, result, method,
          other ? "others" : "standard", largest.places, largest.share, largest.count);
      EXPECT_LE(largest.share, 1) << family << ' ' << result << ' ' << method << ' ' << other;
      if (std::is_same_v<typename Distr::method_type, rng::gaussian_method::icdf>) {
        EXPECT_EQ(largest.count, 0u) << result;  // no function of a library is in it
      }
    }
  }
}

template <typename Engine>
struct closed_form_roads : testing::Test {};
using engines = testing::Types<rng::philox4x32x10, rng::mcg31m1, rng::mcg59, rng::mrg32k3a,
                               rng::mt19937, rng::mt2203, rng::sobol>;
TYPED_TEST_SUITE(closed_form_roads, engines);
TARN_REPORTS_CUDA(closed_form_roads)

TYPED_TEST(closed_form_roads, agree) {
  using namespace rng;
  using rng::gamma;  // <math.h> has one as well
  int rows = 0;
#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) \
  compare_row<TypeParam, TARN_UNWRAP type>(#family, #result, #method, rows);
#include "distributions/distributions.def"
  EXPECT_EQ(rows, 32);
}

template <typename Distr>
void expect_same_into_a_buffer(const Distr& distr) {
  auto engine = engine_at<rng::philox4x32x10>(tarn_test::gpu_queue(), 1);
  auto same = engine_at<rng::philox4x32x10>(tarn_test::gpu_queue(), 1);
  EXPECT_EQ(draw(distr, engine, 1003), tarn_test::draw_into_buffer(distr, same, 1003));
}

TEST(closed_forms_on_a_gpu, go_into_buffers_as_well) {
  expect_same_into_a_buffer(rng::gaussian<float, rng::gaussian_method::box_muller>(1, 2));
  expect_same_into_a_buffer(rng::gaussian<double, rng::gaussian_method::box_muller2>(1, 2));
  expect_same_into_a_buffer(rng::lognormal<double, rng::lognormal_method::icdf>());
  expect_same_into_a_buffer(rng::laplace<float>());
  expect_same_into_a_buffer(rng::weibull<double>(3, 1, 2));
}

TEST(closed_forms_on_a_gpu, draw_box_muller2_accurate_by_inversion) {
  const auto draws = [](const auto& distr) {
    auto engine = engine_at<rng::philox4x32x10>(tarn_test::gpu_queue(), 0);
    return draw(distr, engine, 5000);
  };
  const auto accurate =
      draws(rng::lognormal<float, rng::lognormal_method::box_muller2_accurate>(1, 2, 3, 4));
  EXPECT_EQ(accurate, draws(rng::lognormal<float, rng::lognormal_method::icdf>(1, 2, 3, 4)));
  EXPECT_NE(accurate, draws(rng::lognormal<float, rng::lognormal_method::box_muller2>(1, 2, 3, 4)));
}

TEST(closed_forms_on_a_gpu, take_the_shape_of_weibull_as_the_exponent) {
  auto engine = engine_at<rng::philox4x32x10>(tarn_test::gpu_queue(), 0);
  auto same = engine_at<rng::philox4x32x10>(tarn_test::gpu_queue(), 0);
  const auto squares = draw(rng::weibull<double>(2), engine, 5000);
  const auto values = draw(rng::exponential<double>(), same, 5000);
  for (std::size_t i = 0; i < values.size(); ++i) {
    ASSERT_NEAR(squares[i] / (values[i] * values[i]), 1, 1e-15);
  }
}

}  // namespace
