// SPDX-License-Identifier: Apache-2.0
// Negative binomial values against inversion of the exact law and against rejection candidate by
// candidate with the exact law as the only test. Under each SIMD target.
#include "counts.hpp"

namespace {

using negative_binomial = support::on_simd_target;

constexpr std::int32_t greatest = std::numeric_limits<std::int32_t>::max();

counts::draw routine(double a, double p) {
  return [=](rvx_stream s, std::int64_t n, std::int32_t* r) {
    return rvxiRngNegbinomial(0, s, n, r, a, p);
  };
}

std::int64_t saturated(std::int64_t y) {
  return std::min<std::int64_t>(y, greatest);
}

// A rectangle between the zeros of the law's second difference, and on either side a trapezoid up
// to where the tangent there meets the axis, and an exponential.
counts::propose mountain(const counts::law& law, double a, double p) {
  const auto f = [&](double y) {
    return y < 0 ? 0 : static_cast<double>(law.ratio(static_cast<std::int64_t>(y)));
  };
  // f(y + 1) / f(y), next to 1, so that its logarithm and its distance from 1 want more digits.
  const auto up = [=](double y) -> counts::real {
    return (counts::real(a) + y) * (1 - counts::real(p)) / (counts::real(y) + 1);
  };
  const auto log_up = [=](double y) { return static_cast<double>(log(up(y))); };
  const double v = (a - 1) * (1 - p) / p, deviation = std::sqrt(v / p + 0.25);

  const double kr = std::ceil(v - 0.5 + deviation);
  const double xr = static_cast<double>(kr + 1 / (1 - up(kr)));
  const double ir = std::floor(xr), fr = f(kr), dr = f(ir - 1) / fr;
  const double gr = log_up(ir), hr = f(ir) * std::exp((xr - ir - 1) * gr);

  const double kl = std::floor(v - 0.5 - deviation);
  double begin = 0, xl = 0, fl = 0, dl = 0, gl = 1, hl = 0;
  if (kl >= 1) {
    begin = kl + 1;
    xl = static_cast<double>(begin - 1 / (1 - 1 / up(kl - 1)));
    const double il = std::floor(xl);
    fl = f(kl);
    dl = f(std::max(il + 1, 0.0)) / fl;
    if (il >= 1) {
      gl = log_up(il - 1);
      hl = f(il) * std::exp((xl - il) * gl);
    } else {
      xl = std::min(xl, 0.0);
    }
  }
  const double a0 = kr - begin, a1 = (0.5 + dr) * fr * (xr - kr);
  const double a2 = (0.5 + dl) * fl * (begin - xl), a3 = -hr / gr, a4 = hl / gl;
  const double total = a0 + a1 + a2 + a3 + a4;

  return [=](double u, double v0) -> counts::candidate {
    const double w = counts::raised(v0);
    u *= total;
    if (u < a0)
      return {std::floor(begin + u), w};
    u -= a0;
    if (u <= a1) {
      const double s = std::sqrt(u / a1 * (1 + 2 * dr) + dr * dr);
      return {std::floor(xr - (xr - kr) * (s - dr)), w * fr * s};
    }
    u -= a1;
    if (u <= a2) {
      const double s = std::sqrt(u / a2 * (1 + 2 * dl) + dl * dl);
      return {std::floor(xl + (begin - xl) * (s - dl)), w * fl * s};
    }
    u -= a2;
    if (u <= a3)
      return {std::floor(xr + std::log(w) / gr), w * (u / a3 * hr)};
    u -= a3;
    return {std::floor(xl + std::log(w) / gl), w * (u / a4 * hl)};
  };
}

// For a < 1: 0, then a power, then an exponential, in heights relative to the one of 0.
counts::propose power(double a, double p) {
  const double rate = -std::log1p(-p), b = 1 / rate, gamma = std::tgamma(a);
  const double head = 1;
  const double body = (std::pow(b, a) - std::pow(a / 2, a)) / a / gamma;
  const double height = std::pow(b, a - 1) * std::exp(-rate * (b - a / 2)) / gamma;
  const double tail = height / rate;
  return [=](double u, double v) -> counts::candidate {
    u *= head + body + tail;
    v = counts::raised(v);
    if (u <= head)
      return {0, 0};
    u -= head;
    double z, w;
    if (u <= body) {
      z = std::pow(std::pow(a / 2, a) + u * a * gamma, 1 / a);
      w = v * std::pow(z, a - 1) / gamma;
    } else {
      z = b - std::log(v) / rate;
      w = v * height * (u - body) / tail;
    }
    return {std::floor(z + 1 - a / 2), w};
  };
}

TEST_F(negative_binomial, small_laws_are_inverted) {
  // A mode below 100, and p of at least 1/64.
  constexpr double laws[][2] = {
      {10, 0.4},      {1, 0.51},        {0.5, 0.5},        {1e-300, 0.5}, {0.01, 0.02},
      {2.5, 0.9},     {100.9, 0.5},     {25.9, 0.2},       {899, 0.9},    {0.25, 0.015625},
      {1e6, 0.99991}, {2.58, 0.015625}, {7.5, 1 - 0x1p-53}};
  for (const auto& l : laws) {
    SCOPED_TRACE(testing::Message() << l[0] << ", " << l[1]);
    ASSERT_NO_FATAL_FAILURE(
        counts::expect_inversion(routine(l[0], l[1]), counts::negative_binomial(l[0], l[1])));
  }
}

TEST_F(negative_binomial, large_laws_are_the_mountain) {
  // With and without pieces on the left: those need (a - 1) q > 1, about. Some are wide, with
  // values up to the greatest.
  constexpr double laws[][2] = {
      {101.1, 0.5}, {26.1, 0.2},  {902, 0.9},   {1000, 0.01},  {2.6, 0.015625}, {2.1, 0.015},
      {1, 0.0011},  {1.5, 0.001}, {2.01, 0.01}, {1e5, 0.3},    {1e9, 0.7},      {1.0001, 0.01},
      {1, 1e-9},    {1.5, 1e-6},  {2.5, 1e-9},  {1.001, 1e-9},
  };
  for (const auto& l : laws) {
    SCOPED_TRACE(testing::Message() << l[0] << ", " << l[1]);
    const counts::law law = counts::negative_binomial(l[0], l[1]);
    ASSERT_NO_FATAL_FAILURE(
        counts::expect_rejection(routine(l[0], l[1]), law, mountain(law, l[0], l[1]), saturated));
  }
}

TEST_F(negative_binomial, small_shapes_are_the_power) {
  constexpr double laws[][2] = {{0.5, 0.0156}, {0.999, 0.001}, {0.3, 1e-6}, {0.7, 1e-8}};
  for (const auto& l : laws) {
    SCOPED_TRACE(testing::Message() << l[0] << ", " << l[1]);
    const counts::law law = counts::negative_binomial(l[0], l[1]);
    ASSERT_NO_FATAL_FAILURE(
        counts::expect_rejection(routine(l[0], l[1]), law, power(l[0], l[1]), saturated));
  }
}

TEST_F(negative_binomial, certain_outcomes_take_no_words) {
  for (const double a : {1e-300, 1.0, 1e300})
    counts::expect_constant(routine(a, 1), 0);
  // Smaller results are less likely than one in 2^64.
  counts::expect_constant(routine(1, 0x1p-100), greatest);
  counts::expect_constant(routine(1e300, 1e-300), greatest);
  counts::expect_constant(routine(1e300, 0.5), greatest);
  counts::expect_constant(routine(3e9, 0.5), greatest);
}

// Mean, deviation or both are far above the greatest result, or below any step of a double.
TEST_F(negative_binomial, extreme_laws_give_numbers) {
  constexpr double laws[][2] = {
      {0.5, 5e-324}, {0.001, 1e-300}, {5e-324, 1e-10},    {0.9999, 1e-300},  {1, 0x1p-99},
      {50, 0x1p-99}, {99, 1e-20},     {1.0000001, 1e-15}, {2147483647, 0.5}, {1e300, 1 - 0x1p-53}};
  for (const auto& l : laws) {
    SCOPED_TRACE(testing::Message() << l[0] << ", " << l[1]);
    support::stream s;
    constexpr std::uint32_t ends[] = {0x80000000, 0x7FFFFFFF, 0, 0xFFFFFFFF};
    for (const std::uint32_t u : ends)
      for (const std::uint32_t v : ends) {
        s.set(counts::key, plain::counter_of({u, v, v, u}, counts::key), 0);
        support::results<std::int32_t> r(600);
        ASSERT_EQ(rvxiRngNegbinomial(0, s, 600, r.data(), l[0], l[1]), 0);
        for (std::size_t i = 0; i < 600; ++i)
          ASSERT_GE(r[i], 0);
        ASSERT_TRUE(r.guards_intact());
      }
  }
}

}  // namespace
