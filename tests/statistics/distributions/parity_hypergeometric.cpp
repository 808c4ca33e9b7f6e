// SPDX-License-Identifier: Apache-2.0
// Hypergeometric values against inversion of the exact law and against H2PE as published
// (Kachitvichyanukul, Schmeiser: Computer generation of hypergeometric random variates, J. Stat.
// Comput. Simul. 22, 1985), candidate by candidate with the exact law as the only test. Under each
// SIMD target.
#include "counts.hpp"

namespace {

using hypergeometric = support::on_simd_target;

counts::draw routine(std::int32_t lot, std::int32_t sample, std::int32_t marked) {
  return [=](rvx_stream s, std::int64_t n, std::int32_t* r) {
    return rvxiRngHypergeometric(0, s, n, r, lot, sample, marked);
  };
}

counts::propose h2pe(const counts::law& law, double n1, double n2, double k) {
  const double lot = n1 + n2, m = std::floor((k + 1) * (n1 + 1) / (lot + 2));
  const double d =
      std::floor(1.5 * std::sqrt((lot - k) / lot * k * n1 / (lot - 1) * n2 / lot)) + 0.5;
  const double xl = m - d + 0.5, xr = m + d + 0.5;
  const auto kl = static_cast<double>(law.ratio(static_cast<std::int64_t>(xl)));
  const auto kr = static_cast<double>(law.ratio(static_cast<std::int64_t>(xr - 1)));
  const double ll = -std::log(xl * (n2 - k + xl) / (n1 - xl + 1) / (k - xl + 1));
  const double lr = -std::log((n1 - xr + 1) * (k - xr + 1) / xr / (n2 - k + xr));
  const double p1 = 2 * d, p2 = p1 + kl / ll, p3 = p2 + kr / lr;
  return [=](double u, double v) -> counts::candidate {
    u *= p3;
    v = counts::raised(v);
    if (u <= p1)
      return {std::floor(xl + u), v};
    if (u <= p2)
      return {std::floor(xl + std::log(v) / ll), v * (u - p1) * ll};
    return {std::floor(xr - std::log(v) / lr), v * (u - p2) * lr};
  };
}

// n1 elements of the rarer kind among n1 + n2, k drawn, in the four forms that symmetry gives it:
// the number of the rarer kind that are drawn is y, and that of the marked ones is
struct form {
  std::int32_t sample, marked, origin;
  bool falling;  // origin - y instead of origin + y
};
std::vector<form> forms(std::int32_t n1, std::int32_t n2, std::int32_t k) {
  const std::int32_t lot = n1 + n2;
  std::vector<form> all{{k, n1, 0, false}};
  if (n1 != n2)
    all.push_back({k, n2, k, true});
  if (2 * std::int64_t{k} != lot) {
    all.push_back({lot - k, n1, n1, true});
    if (n1 != n2)
      all.push_back({lot - k, n2, n2 - k, false});
  }
  return all;
}

struct lot {
  std::int32_t n1, n2, k;
};

TEST_F(hypergeometric, small_laws_are_inverted) {
  // Up to a mode of 39.
  constexpr lot lots[] = {{1, 1, 1},
                          {3, 9, 5},
                          {50, 50, 30},
                          {79, 80, 79},
                          {100, 200, 118},
                          {12, 2147483635, 1000000000},
                          {40000, 2000000000, 1949999},
                          {1000000000, 1147483647, 80}};
  for (const lot& l : lots)
    for (const form& f : forms(l.n1, l.n2, l.k)) {
      SCOPED_TRACE(testing::Message() << l.n1 + l.n2 << ", " << f.sample << ", " << f.marked);
      const auto rarer = counts::hypergeometric(std::int64_t{l.n1} + l.n2, l.k, l.n1);
      ASSERT_LT(rarer.mode, 40);
      const counts::draw draw = routine(l.n1 + l.n2, f.sample, f.marked);
      // A rising image moves the values of the law.
      const counts::law moved(rarer.least + f.origin, rarer.greatest + f.origin,
                              rarer.mode + f.origin,
                              [&](std::int64_t y) { return rarer.log_at(y - f.origin); });
      if (f.falling)
        ASSERT_NO_FATAL_FAILURE(counts::expect_inversion(draw, rarer, f.origin));
      else
        ASSERT_NO_FATAL_FAILURE(counts::expect_inversion(draw, moved));
    }
}

TEST_F(hypergeometric, large_laws_are_h2pe) {
  constexpr lot lots[] = {{80, 80, 80},
                          {100, 200, 121},
                          {300, 99700, 50000},
                          {700, 1300, 700},
                          {1000000, 2000000, 100000},
                          {2000, 2147481647, 1000000000},
                          {1000000000, 1147483647, 1000000000}};
  for (const lot& l : lots)
    for (const form& f : forms(l.n1, l.n2, l.k)) {
      SCOPED_TRACE(testing::Message() << l.n1 + l.n2 << ", " << f.sample << ", " << f.marked);
      const auto rarer = counts::hypergeometric(std::int64_t{l.n1} + l.n2, l.k, l.n1);
      ASSERT_GE(rarer.mode, 40);
      ASSERT_NO_FATAL_FAILURE(counts::expect_rejection(
          routine(l.n1 + l.n2, f.sample, f.marked), rarer, h2pe(rarer, l.n1, l.n2, l.k),
          [&](std::int64_t y) { return f.falling ? f.origin - y : f.origin + y; }));
    }
}

TEST_F(hypergeometric, certain_outcomes_take_no_words) {
  for (const std::int32_t l : {0, 1, 2, 9, 2147483647}) {
    for (const std::int32_t part : {0, l / 2, l - l / 2, l}) {
      counts::expect_constant(routine(l, part, 0), 0);
      counts::expect_constant(routine(l, 0, part), 0);
      counts::expect_constant(routine(l, part, l), part);
      counts::expect_constant(routine(l, l, part), part);
    }
  }
}

}  // namespace
