// SPDX-License-Identifier: Apache-2.0
// Binomial values against inversion of the exact law and against BTPE as published
// (Kachitvichyanukul, Schmeiser: Binomial random variate generation, Comm. ACM 31, 1988), candidate
// by candidate with the exact law as the only test. Under each SIMD target.
#include "counts.hpp"

namespace {

using binomial = support::on_simd_target;

counts::draw routine(std::int32_t ntrial, double p) {
  return [=](rvx_stream s, std::int64_t n, std::int32_t* r) {
    return rvxiRngBinomial(0, s, n, r, ntrial, p);
  };
}

counts::propose btpe(double n, double r) {
  const double q = 1 - r, npq = n * r * q, fm = n * r + r, m = std::floor(fm);
  const double p1 = std::floor(2.195 * std::sqrt(npq) - 4.6 * q) + 0.5;
  const double xm = m + 0.5, xl = xm - p1, xr = xm + p1, c = 0.134 + 20.5 / (15.3 + m);
  const double al = (fm - xl) / (fm - xl * r), ll = al * (1 + al / 2);
  const double ar = (xr - fm) / (xr * q), lr = ar * (1 + ar / 2);
  const double p2 = p1 * (1 + 2 * c), p3 = p2 + c / ll, p4 = p3 + c / lr;
  return [=](double u, double v) -> counts::candidate {
    u *= p4;
    if (u <= p1)
      return {std::floor(xm - p1 * v + u), 0};
    if (u <= p2) {
      const double x = xl + (u - p1) / c;
      const double w = v * c + 1 - std::abs(xm - x) / p1;
      return {w > 1 ? -1 : std::floor(x), w};
    }
    v = counts::raised(v);
    if (u <= p3)
      return {std::floor(xl + std::log(v) / ll), v * (u - p2) * ll};
    return {std::floor(xr - std::log(v) / lr), v * (u - p3) * lr};
  };
}

TEST_F(binomial, small_laws_are_inverted) {
  // Up to an expected 30 of the rarer outcome.
  const struct {
    std::int32_t n;
    double p;
  } laws[] = {
      {1, 0.3},  {1, 0.5},      {2, 1e-300},        {50, 0.4},          {59, 0.5},
      {74, 0.4}, {300, 0.0999}, {1000000, 29.9e-6}, {2147483647, 1e-9}, {2147483647, 1.39e-8}};
  for (const auto& l : laws) {
    SCOPED_TRACE(testing::Message() << l.n << ", " << l.p);
    ASSERT_NO_FATAL_FAILURE(
        counts::expect_inversion(routine(l.n, l.p), counts::binomial(l.n, l.p)));
    // A likely outcome: its failures by the same words.
    const double likely = 1 - l.p;
    if (likely <= 0.5 || likely == 1)
      continue;
    const auto failures = counts::binomial(l.n, 1 - likely);
    ASSERT_NO_FATAL_FAILURE(counts::expect_inversion(routine(l.n, likely), failures, l.n));
  }
}

TEST_F(binomial, large_laws_are_btpe) {
  const struct {
    std::int32_t n;
    double p;
  } laws[] = {{60, 0.5},         {75, 0.4},          {100, 0.4},          {300, 0.1001},
              {500, 0.5},        {5000, 0.1},        {1000000, 0.3},      {1000000, 30.1e-6},
              {2147483647, 0.5}, {2147483647, 1e-6}, {2147483647, 1.5e-8}};
  for (const auto& l : laws) {
    SCOPED_TRACE(testing::Message() << l.n << ", " << l.p);
    ASSERT_NO_FATAL_FAILURE(
        counts::expect_rejection(routine(l.n, l.p), counts::binomial(l.n, l.p), btpe(l.n, l.p)));
    const double likely = 1 - l.p;
    if (likely <= 0.5)
      continue;
    const auto failures = counts::binomial(l.n, 1 - likely);
    ASSERT_NO_FATAL_FAILURE(counts::expect_rejection(routine(l.n, likely), failures,
                                                     btpe(l.n, 1 - likely),
                                                     [&](std::int64_t y) { return l.n - y; }));
  }
}

TEST_F(binomial, certain_outcomes_take_no_words) {
  for (const std::int32_t n : {1, 100, 2147483647}) {
    counts::expect_constant(routine(n, 0), 0);
    counts::expect_constant(routine(n, 1), n);
  }
}

}  // namespace
