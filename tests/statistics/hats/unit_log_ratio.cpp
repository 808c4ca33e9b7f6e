// SPDX-License-Identifier: Apache-2.0
// The logarithms of P(y) / P(mode) that rejections compare with, as their set-ups make them,
// against 34 digits: the error that log_ratio.hpp states holds up to the largest parameters, of
// which the factorials alone are 10^11 times the bound.
#include <cmath>

#include "distributions/binomial.hpp"
#include "distributions/counts.hpp"
#include "distributions/hypergeometric.hpp"
#include "distributions/log_ratio.hpp"
#include "distributions/negative_binomial.hpp"
#include "distributions/ptpe.hpp"

namespace {

using log_ratio_errors = support::on_simd_target;
using counts::real;
using tarn::statistics::log_ratio;

constexpr double anywhere = 0x1p-40, next_to_mode = 0x1p-43;  // bounds
constexpr double least_log = -45;                             // that the first bound holds for

constexpr std::int32_t most = std::numeric_limits<std::int32_t>::max();

// `exact` tells ln P(y) up to a constant. Values up to `reach` from the mode, most of them near.
template <class Exact>
void compare(const log_ratio& ratio, double mode, double least, double greatest, double reach,
             const Exact& exact) {
  support::test_data data(5);
  const real at_mode = exact(real(mode));
  std::size_t judged = 0, near = 0;
  double worst = 0, worst_near = 0;
  for (int i = 0; i < 3000; ++i) {
    const double part = std::ldexp(static_cast<double>(data() >> 11), -53);
    const double k = std::floor(reach * part * part * part);
    const double y = i % 2 == 0 ? mode + k : mode - k;
    if (y < least || y > greatest)
      continue;
    const real expected = exact(real(y)) - at_mode;
    const auto log = static_cast<double>(expected);
    if (log < least_log)
      continue;
    const double error = std::fabs(
        static_cast<double>(boost::multiprecision::log(real(ratio_of(ratio, y))) - expected));
    worst = std::max(worst, error);
    ++judged;
    if (log < -1)
      continue;
    worst_near = std::max(worst_near, error);
    ++near;
  }
  EXPECT_LE(worst, anywhere);
  EXPECT_LE(worst_near, next_to_mode);
  EXPECT_GT(judged, 500u);
  EXPECT_GT(near, 200u);
  std::printf("errors of the logarithm: %.2g, next to the mode %.2g\n", worst, worst_near);
}

TEST_F(log_ratio_errors, binomial) {
  for (const std::int32_t n : {200, 100000, most - 1, most})
    for (const double p : {0.3, 0.49999999999, 0.5, 1e-7, 0.7123456789, 1 - 1e-7}) {
      const tarn::statistics::binomial_law law(n, p);
      if (law.by_table())
        continue;
      SCOPED_TRACE(testing::Message() << n << ", " << p);
      const tarn::statistics::btpe of(law, 1);
      const real log_r = log(real(law.r)), log_q = log(real(1 - real(law.r)));
      compare(of.ratio, of.ratio.reference, 0, n, 10 * std::sqrt(of.npq),
              [&](const real& y) -> real {
                return -counts::log_factorial(y) - counts::log_factorial(n - y) + y * log_r +
                       (n - y) * log_q;
              });
    }
}

TEST_F(log_ratio_errors, hypergeometric) {
  constexpr std::int32_t laws[][3] = {{2000, 700, 1300},
                                      {most, 1 << 30, 1 << 30},
                                      {most, 1073741823, 1073741822},
                                      {most - 1, 2000, 1000000000},
                                      {most, 2000000000, 1500000000},
                                      {most, 3000000, 7000000}};
  for (const auto& l : laws) {
    SCOPED_TRACE(testing::Message() << l[0] << ", " << l[1] << ", " << l[2]);
    const tarn::statistics::hypergeometric_law law(l[0], l[1], l[2]);
    ASSERT_FALSE(law.by_table());
    const tarn::statistics::h2pe of(law, 1);
    compare(of.ratio, of.ratio.reference, 0, of.greatest, 4 * (of.xr - of.xl),
            [&](const real& y) -> real {
              return -counts::log_factorial(y) - counts::log_factorial(of.n1 - y) -
                     counts::log_factorial(of.k - y) - counts::log_factorial(of.n2_k + y);
            });
  }
}

TEST_F(log_ratio_errors, poisson) {
  for (const double rate : {32.0, 1234.5, 2147483646.7, 1e12, 0x1p40}) {
    SCOPED_TRACE(rate);
    const tarn::statistics::ptpe of(rate, 1);
    const real log_rate = log(real(rate));
    compare(of.ratio, of.ratio.reference, 0, 1e300, 10 * std::sqrt(rate),
            [&](const real& y) -> real { return y * log_rate - counts::log_factorial(y); });
  }
}

TEST_F(log_ratio_errors, negative_binomial) {
  constexpr double laws[][2] = {{1, 1e-9},          {1.5, 1e-9},       {2.5, 1e-9},
                                {1.0001, 1e-7},     {1.000001, 0.01},  {20.3, 1e-8},
                                {1e9, 0.6},         {2e9, 0.50000001}, {1e5, 0.3},
                                {2147483647, 0.99}, {1e12, 0.9999},    {1e5 / 3, 1e-4}};
  for (const auto& l : laws) {
    SCOPED_TRACE(testing::Message() << l[0] << ", " << l[1]);
    const tarn::statistics::negative_binomial_law law(l[0], l[1]);
    ASSERT_FALSE(law.by_table() || law.saturated());
    const tarn::statistics::nbar of(law, 1);
    const real log_q = log(real(1 - real(l[1])));
    const double mode = std::floor(law.v);
    compare(
        of.ratio, mode, 0, 1e300,
        std::min(10 * std::sqrt((law.v + 1) / law.p), 45 / law.p + 10 * std::sqrt(law.v / law.p)),
        [&](const real& y) -> real {
          return counts::log_factorial(y + real(l[0] - 1)) - counts::log_factorial(y) + y * log_q;
        });
  }
}

}  // namespace
