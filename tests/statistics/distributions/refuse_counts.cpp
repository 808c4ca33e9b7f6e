// SPDX-License-Identifier: Apache-2.0
// What poisson, poisson_v, bernoulli, geometric and multinomial refuse: with the number of the
// argument, nothing written, and the stream where it was. By the raw entries too, which callers
// reach without the checks in front.
#include <cmath>
#include <functional>
#include <limits>

#include "any_stream.hpp"

namespace {

constexpr double infinity = std::numeric_limits<double>::infinity();
const double nan = std::nan("");

using attempt = std::function<int(rvx_stream, std::int32_t*)>;

void expect_refused(int status, const attempt& call) {
  const support::reports quiet;
  support::stream s(1);
  const plain::stream before = s.position();
  support::results<std::int32_t> r(64);
  EXPECT_EQ(call(s, r.data()), status);
  EXPECT_TRUE(r.untouched());
  EXPECT_TRUE(support::same_position(s, before));
}

TEST(refuse_counts, rates) {
  for (const double rate : {0.0, -0.0, -1.0, -infinity, infinity, nan}) {
    for (const int method : {0, 1}) {
      expect_refused(-5, [=](auto s, auto* r) { return rvxiRngPoisson(method, s, 8, r, rate); });
      expect_refused(-5, [=](auto s, auto* r) { return _rvxiRngPoisson(method, s, 8, r, rate); });
    }
    // Wherever the bad one stands.
    for (const std::size_t place : {0u, 3u, 7u}) {
      std::vector<double> rates(8, 2.5);
      rates[place] = rate;
      expect_refused(-5,
                     [&](auto s, auto* r) { return rvxiRngPoissonV(0, s, 8, r, rates.data()); });
      expect_refused(-5,
                     [&](auto s, auto* r) { return _rvxiRngPoissonV(0, s, 8, r, rates.data()); });
    }
  }
  expect_refused(-5, [](auto s, auto* r) { return rvxiRngPoissonV(0, s, 8, r, nullptr); });
  expect_refused(-5, [](auto s, auto* r) { return _rvxiRngPoissonV(0, s, 8, r, nullptr); });
}

TEST(refuse_counts, methods_of_poisson) {
  for (const int method : {2, 3, 4, 7, 0x40000000, 0x40000001, 0x7FFFFFFF}) {
    expect_refused(-1, [=](auto s, auto* r) { return rvxiRngPoisson(method, s, 8, r, 3); });
    expect_refused(-1, [=](auto s, auto* r) { return _rvxiRngPoisson(method, s, 8, r, 3); });
  }
  expect_refused(-1, [](auto s, auto* r) { return rvxiRngPoisson(-1, s, 8, r, 3); });
}

TEST(refuse_counts, probabilities) {
  for (const double p : {-0.1, -5e-324, std::nextafter(1.0, 2.0), 2.0, infinity, -infinity, nan}) {
    expect_refused(-5, [=](auto s, auto* r) { return rvxiRngBernoulli(0, s, 8, r, p); });
    expect_refused(-5, [=](auto s, auto* r) { return _rvxiRngBernoulli(0, s, 8, r, p); });
    expect_refused(-5, [=](auto s, auto* r) { return rvxiRngGeometric(0, s, 8, r, p); });
    expect_refused(-5, [=](auto s, auto* r) { return _rvxiRngGeometric(0, s, 8, r, p); });
  }
  expect_refused(-5, [](auto s, auto* r) { return rvxiRngGeometric(0, s, 8, r, 0); });
}

TEST(refuse_counts, multinomial) {
  const auto refused = [](int status, std::int32_t ntrial, std::int32_t categories,
                          const double* p) {
    expect_refused(status, [=](auto s, auto* r) {
      return rvxiRngMultinomial(0, s, 4, r, ntrial, categories, p);
    });
    expect_refused(status, [=](auto s, auto* r) {
      return _rvxiRngMultinomial(0, s, 4, r, ntrial, categories, p);
    });
  };
  const double good[] = {0.25, 0.25, 0.5};
  refused(-5, -1, 3, good);
  refused(-6, 5, 0, good);
  refused(-6, 5, -1, good);
  refused(-7, 5, 3, nullptr);
  for (const std::int32_t ntrial : {0, 5, 100000})
    for (const double bad : {-0.25, -5e-324, nan, infinity, 0.0, 0.26, 0.25 + 0x1p-46}) {
      const double p[] = {0.25, bad, 0.5};
      refused(-7, ntrial, 3, p);
    }
  const double one_bad[] = {0.5};
  refused(-7, 5, 1, one_bad);
}

// The sum may miss 1 by 2^-49 for each category.
TEST(refuse_counts, the_tolerance_of_the_sum) {
  const support::reports quiet;
  support::stream s(1);
  std::int32_t r[3];
  for (const double error : {0x1p-49, 0x1.8p-48, -0x1p-48, 0x1p-47, -0x1p-47, 0x1p-46}) {
    const double p[] = {0.25, 0.25 + error, 0.5};
    const bool within = std::fabs(error) <= 3 * 0x1p-49;
    EXPECT_EQ(rvxiRngMultinomial(0, s, 1, r, 5, 3, p), within ? 0 : -7) << error;
  }
}

// A sequence that ends: too few words for the whole call.
TEST(refuse_counts, the_end_of_a_finite_sequence) {
  const double p[] = {0.5, 0.5}, rates[] = {1, 2, 3, 4, 50, 60, 70, 80};
  const float mean[] = {0, 0, 0}, scale[] = {1, 1, 1};
  const auto ends = [&](std::uint64_t left,
                        const std::function<int(rvx_stream, std::int32_t*)>& call) {
    const support::reports quiet;
    support::any_stream s(RVX_BRNG_SOBOL, {1});
    // 2^32 - 1 points of one dimension.
    s.skip(0xFFFFFFFF - left);
    support::results<std::int32_t> r(64);
    const auto before = s.image();
    EXPECT_EQ(call(s, r.data()), RVX_STATUS_END_OF_SEQUENCE);
    EXPECT_TRUE(r.untouched());
    EXPECT_EQ(s.image(), before);
  };
  ends(7, [](auto s, auto* r) { return rvxiRngPoisson(1, s, 8, r, 3); });
  ends(7, [](auto s, auto* r) { return rvxiRngPoisson(1, s, 8, r, 300); });
  ends(7, [&](auto s, auto* r) { return rvxiRngPoissonV(1, s, 8, r, rates); });
  ends(7, [](auto s, auto* r) { return rvxiRngBernoulli(0, s, 8, r, 0.5); });
  ends(7, [](auto s, auto* r) { return rvxiRngGeometric(0, s, 8, r, 0.5); });
  ends(39, [&](auto s, auto* r) { return rvxiRngMultinomial(0, s, 8, r, 5, 2, p); });
  ends(8, [&](auto s, auto* r) {
    return rvxsRngGaussianMV(2, s, 3, reinterpret_cast<float*>(r), 3, 2, mean, scale);
  });
}

}  // namespace
