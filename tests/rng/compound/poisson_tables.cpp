// SPDX-License-Identifier: Apache-2.0
// The tables of poisson's inverse, and what the functors make of them and of the formula of large
// rates, against the law: its cdf is P(X <= k) = Q(k + 1, lambda), the regularised upper incomplete
// gamma function.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <string>
#include <vector>

#include <sycl/sycl.hpp>

#include <boost/math/special_functions/erf.hpp>
#include <boost/math/special_functions/gamma.hpp>
#include <gtest/gtest.h>

#include "distributions/poisson_functors.hpp"

namespace {

namespace gpu = kestrel::tarn::rng::detail::gpu;
namespace bm = boost::math;

double polynomial(std::vector<double> c, double t) {
  double sum = 0;
  for (auto term = c.rbegin(); term != c.rend(); ++term) {
    sum = sum * t + *term;
  }
  return sum;
}

/// A, B and P1 to P4 for one rate.
struct inverse {
  double a, b;
  std::vector<double> p;
  double operator()(double z) const { return a + b * z * polynomial(p, z); }
};

template <typename Real>
std::vector<double> cubic_at(const Real* c) {
  return {c[0], c[1], c[2], c[3]};
}

inverse medium(int row, double t) {
  const float* c = gpu::medium_lambda_table_32 + 23 * row;
  inverse x{polynomial({c[0], c[1], c[2]}, t), polynomial(cubic_at(c + 3), t), {}};
  for (int i = 7; i < 23; i += 4) {
    x.p.push_back(polynomial(cubic_at(c + i), t));
  }
  return x;
}

inverse wide(int row, double lambda, double t) {
  const double* c = gpu::poisson_v_interval_constants + 20 * row;
  inverse x{lambda + c[0] + c[1] * t, std::sqrt(lambda) + c[2] + c[3] * t, {}};
  for (int i = 4; i < 20; i += 4) {
    x.p.push_back(polynomial(cubic_at(c + i), t));
  }
  return x;
}

/// z with Phi(z) = P(X <= k), from the smaller tail.
double deviate(double k, double lambda) {
  const double below = bm::gamma_q(k + 1, lambda);
  const double root_two = std::sqrt(2.0);
  return below < 0.5 ? -root_two * bm::erfc_inv(2 * below)
                     : root_two * bm::erfc_inv(2 * bm::gamma_p(k + 1, lambda));
}

/// The largest |x(z_k) - k| / B over the values that lie within three deviations of the median.
double largest_deviation(const inverse& x, double lambda) {
  double largest = 0;
  int values = 0;
  const double first = std::max(0.0, std::floor(lambda - 4 * std::sqrt(lambda)));
  for (double k = first; bm::gamma_p(k + 1, lambda) > 0.00135; ++k) {
    if (bm::gamma_q(k + 1, lambda) > 0.00135) {
      largest = std::max(largest, std::fabs(x(deviate(k, lambda)) - k) / x.b);
      ++values;
    }
  }
  EXPECT_GT(values, 0) << lambda;
  return largest;
}

constexpr double places[] = {0, 0.11, 0.27, 0.5, 0.56, 0.73, 0.92, 0.9999};

// Q(A + 1, lambda) = 1/2: A is a quadratic, off by 1.2e-4 at most in the first row, by less above.
TEST(poisson_tables, the_centre_is_the_median) {
  for (int row = 0; row < 7; ++row) {
    for (const double t : places) {
      const double lambda = std::ldexp(1 + t, row);
      if (lambda < 100) {
        EXPECT_NEAR(bm::gamma_q(medium(row, t).a + 1, lambda), 0.5, 1e-4) << lambda;
      }
    }
  }
}

// B is the scale of large rates carried on: the root of lambda - 1/18 up to terms in 1 / lambda,
// where they come to 0.0013 at 1.
TEST(poisson_tables, the_scale_is_that_of_large_rates) {
  for (int row = 0; row < 7; ++row) {
    for (const double t : places) {
      const double lambda = std::ldexp(1 + t, row);
      if (lambda < 100) {
        EXPECT_NEAR(medium(row, t).b / std::sqrt(lambda - 1.0 / 18), 1, 1e-3) << lambda;
      }
    }
  }
}

// Coefficients known to eight digits, which depend on the nodes and the weights of the fit in all
// but their leading figures: each bound is about twice the distance of least squares and of the
// fits of least error at these places. 2^-18 is the spacing of float at 63, 2^-17 that at 64.
TEST(poisson_tables, telling_rows) {
  const struct {
    int index;
    float known;
    double bound;
  } coefficients[] = {
      {0, 0.31437296f, 5e-6},      {1, 1.0151234f, 5e-5},      {2, -0.0062466529f, 1e-4},
      {3, 0.97110659f, 2e-5},      {138, 63.333027f, 0x1p-17}, {139, 64.000282f, 0x1p-17},
      {140, -0.0001634162f, 1e-5}, {141, 7.996635f, 2e-5},
  };
  for (const auto& c : coefficients) {
    EXPECT_NEAR(gpu::medium_lambda_table_32[c.index], c.known, c.bound) << c.index;
  }
}

// In deviations of the law: 0.004 is the probability of 0.0016 in the middle of a law, where a
// value has one of 0.4 / B.
TEST(poisson_tables, medium_rates_pass_the_values_where_the_law_does) {
  double largest = 0;
  for (int row = 0; row < 7; ++row) {
    for (const double t : places) {
      const double lambda = std::ldexp(1 + t, row);
      if (lambda < 100) {
        const double deviation = largest_deviation(medium(row, t), lambda);
        EXPECT_LT(deviation, row == 0 ? 4e-3 : row < 4 ? 2.5e-3 : 6e-4) << lambda;
        largest = std::max(largest, deviation);
      }
    }
  }
  RecordProperty("largest_deviation", std::to_string(largest));
}

// The first rows have one or two values; the last one takes half of what its octave has to be
// corrected by.
TEST(poisson_tables, a_rate_for_each_passes_the_values_where_the_law_does) {
  double largest = 0;
  for (int row = 0; row < 18; ++row) {
    for (const double t : places) {
      const double lambda = std::ldexp(1 + t, row - 4);
      const double deviation = largest_deviation(wide(row, lambda, t), lambda);
      EXPECT_LT(deviation, row < 6 || row == 17 ? 1e-2 : row < 8 ? 2.5e-3 : 6e-4) << lambda;
      largest = std::max(largest, deviation);
    }
  }
  RecordProperty("largest_deviation", std::to_string(largest));
}

// ---- The functors -----------------------------------------------------------------------------

/// Floats of [-1, 1] by their rank: 0 is 0, and neighbours are neighbours.
constexpr std::int64_t last_rank = 0x3F800000;
float float_of_rank(std::int64_t rank) {
  const auto size = static_cast<std::uint32_t>(rank < 0 ? -rank : rank);
  return sycl::bit_cast<float>(size | (rank < 0 ? 0x80000000u : 0u));
}

/// The probability that a functor stays below k, for the float next to a uniform of [-1, 1): its
/// share of the line up to the middle between the last float below k and the first one that is not.
template <typename Functor>
double below(const Functor& functor, std::int64_t k, bool of_size) {
  std::int64_t low = of_size ? 0 : -last_rank;
  std::int64_t high = last_rank;
  if (functor(float_of_rank(low)) >= k) {
    return 0;
  }
  if (functor(float_of_rank(high)) < k) {
    return 1;
  }
  while (high - low > 1) {
    const std::int64_t middle = low + (high - low) / 2;
    (functor(float_of_rank(middle)) < k ? low : high) = middle;
  }
  const double edge = 0.5 * float_of_rank(low) + 0.5 * float_of_rank(high);
  return of_size ? edge : (edge + 1) / 2;
}

/// The distance in total variation from the law. `of_size`: the size of the uniform counts alone.
template <typename Functor>
double total_variation(const Functor& functor, double lambda, bool of_size) {
  const double spread = 8 * std::sqrt(lambda);
  const auto first = static_cast<std::int64_t>(std::max(0.0, std::floor(lambda - spread) - 2));
  const auto last = static_cast<std::int64_t>(std::ceil(lambda + spread)) + 14;
  double before = below(functor, first, of_size);
  double law_before = first == 0 ? 0 : bm::gamma_q(static_cast<double>(first), lambda);
  double sum = std::fabs(before - law_before);
  for (std::int64_t k = first; k <= last; ++k) {
    const double reached = below(functor, k + 1, of_size);
    const double law = bm::gamma_q(static_cast<double>(k) + 1, lambda);
    sum += std::fabs((reached - before) - (law - law_before));
    before = reached;
    law_before = law;
  }
  return (sum + std::fabs(before - law_before)) / 2;
}

/// 200 rates in equal ratios: 0.01 to 1e5.
constexpr int rate_count = 200;
double rate_of(int i) {
  return 0.01 * std::pow(1e7, static_cast<double>(i) / (rate_count - 1));
}

struct of_one_rate {
  gpu::poisson_gaussian_icdf_based<std::int32_t> kernel;
  explicit of_one_rate(double lambda) : kernel{static_cast<float>(lambda)} {}
  std::int64_t operator()(float u) const { return kernel.one(u); }
};
struct of_a_list {
  double lambda;
  std::int64_t operator()(float u) const {
    return gpu::poisson_v_gaussian_icdf_based<std::int32_t>{&lambda, -1, 1, 1}.at(u, 0);
  }
};

/// Both functors never fall as u grows; without that the edges found above would mean nothing. The
/// tails go in steps of 2^-24, as floats do there.
template <typename Functor>
void expect_monotone(const Functor& functor, double lambda) {
  std::int64_t before = functor(-1);
  const auto look_at = [&](float u) {
    const std::int64_t now = functor(u);
    ASSERT_GE(now, before) << lambda << ' ' << u;
    before = now;
  };
  for (int i = -(1 << 24); i < -(1 << 24) + 512; ++i) {
    look_at(static_cast<float>(i) * 0x1p-24f);
  }
  for (int i = -(1 << 12) + 1; i < 1 << 12; ++i) {
    look_at(static_cast<float>(i) * 0x1p-12f);
  }
  for (int i = (1 << 24) - 512; i <= 1 << 24; ++i) {
    look_at(static_cast<float>(i) * 0x1p-24f);
  }
}

TEST(poisson_inverse, grows_with_the_uniform) {
  for (int i = 0; i < rate_count; ++i) {
    const double lambda = rate_of(i);
    ASSERT_NO_FATAL_FAILURE(expect_monotone(of_one_rate(lambda), lambda));
    if (lambda >= 0.0625) {
      ASSERT_NO_FATAL_FAILURE(expect_monotone(of_a_list{lambda}, lambda));
    }
  }
}

// Between 1 and 4 four powers of the deviate are too few for more; small rates have the exponential
// to 3e-7, or to 2e-5 in poisson_v just below a sixteenth.
TEST(poisson_inverse, is_within_a_thousandth_of_the_law_in_total_variation) {
  double largest = 0;
  double largest_of_list = 0;
  std::puts("        lambda    poisson  poisson_v");
  for (int i = 0; i < rate_count; ++i) {
    const double lambda = rate_of(i);
    const auto narrow = static_cast<double>(static_cast<float>(lambda));
    const double one = total_variation(of_one_rate(lambda), narrow, false);
    const double list = total_variation(of_a_list{lambda}, lambda, lambda < 0.0625);
    EXPECT_LT(one, lambda < 1 ? 1e-6 : 1e-3) << lambda;
    EXPECT_LT(list, lambda < 0.0625 ? 1e-4 : 1e-3) << lambda;
    largest = std::max(largest, one);
    largest_of_list = std::max(largest_of_list, list);
    if (i % 9 == 0) {
      std::printf("%14.4g    %.1e    %.1e\n", lambda, one, list);
    }
  }
  std::printf("       largest    %.1e    %.1e\n", largest, largest_of_list);
  RecordProperty("largest", std::to_string(largest * 1e6) + "e-6");
  RecordProperty("largest_of_list", std::to_string(largest_of_list * 1e6) + "e-6");
}

// The last row corrects the rates of its octave by half, and adds as much to those that need none.
TEST(poisson_inverse, shares_its_last_row_among_all_rates_from_8192_on) {
  for (const double lambda : {8191.9, 8192.0, 8193.0, 16383.0, 16384.0, 65536.0, 0x1p20}) {
    const double distance = total_variation(of_a_list{lambda}, lambda, false);
    EXPECT_LT(distance, lambda < 8192 ? 1e-5 : 6e-4) << lambda;
  }
}

}  // namespace
