// SPDX-License-Identifier: Apache-2.0
// Shared by the tests of distributions of counts that work by inversion or from under a hat: laws
// in 50 digits, values by the definition of inversion, and rejection candidate by candidate on the
// plain stream, without tables, squeezes or blocks.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <utility>
#include <vector>

#include <boost/math/special_functions/bernoulli.hpp>
#include <boost/multiprecision/cpp_bin_float.hpp>
#include <gtest/gtest.h>

#include "support.hpp"

namespace counts {

using real = boost::multiprecision::cpp_bin_float_quad;

// ln x! for x > -1: as (x + k)! / ((x + 1) ... (x + k)) with x + k >= 40, by Stirling's series,
// whose next term is below 10^-32 there.
inline real log_factorial(real x) {
  real product = 1;
  while (x < 40)
    product *= (x += 1);
  static const real half_log_two_pi = log(real(2) * boost::math::constants::pi<real>()) / 2;
  const real inverse = 1 / x, square = inverse * inverse;
  real series = 0, power = inverse;
  for (int k = 1; k <= 10; ++k, power *= square)
    series += boost::math::bernoulli_b2n<real>(k) / (2 * k * (2 * k - 1)) * power;
  return (x + real(0.5)) * log(x) - x + half_log_two_pi + series - log(product);
}

// A law by the logarithms of its probabilities; values without probability are never asked for.
class law {
 public:
  law(std::int64_t from, std::int64_t to, std::int64_t most_likely,
      std::function<real(std::int64_t)> log_probability)
      : least(from),
        greatest(to),
        mode(most_likely),
        log_probability_(std::move(log_probability)) {}

  const real& log_at(std::int64_t y) const {
    const auto found = known_.find(y);
    return found != known_.end() ? found->second
                                 : known_.emplace(y, log_probability_(y)).first->second;
  }
  // P(y) / P(mode).
  real ratio(std::int64_t y) const { return exp(real(log_at(y) - log_at(mode))); }

  const std::int64_t least, greatest, mode;

 private:
  std::function<real(std::int64_t)> log_probability_;
  mutable std::map<std::int64_t, real> known_;
};

inline law binomial(std::int64_t n, double p) {
  const real log_p = log(real(p)), log_q = log(real(1 - real(p)));
  return {0, n, static_cast<std::int64_t>((static_cast<double>(n) + 1) * p),
          [=](std::int64_t y) -> real {
            return log_factorial(n) - log_factorial(y) - log_factorial(n - y) + y * log_p +
                   (n - y) * log_q;
          }};
}

inline law hypergeometric(std::int64_t lot, std::int64_t sample, std::int64_t marked) {
  const auto log_choose = [](std::int64_t n, std::int64_t k) -> real {
    return log_factorial(n) - log_factorial(k) - log_factorial(n - k);
  };
  const real all = log_choose(lot, sample);
  return {std::max<std::int64_t>(0, sample + marked - lot), std::min(sample, marked),
          (sample + 1) * (marked + 1) / (lot + 2), [=](std::int64_t y) -> real {
            return log_choose(marked, y) + log_choose(lot - marked, sample - y) - all;
          }};
}

inline law negative_binomial(double a, double p) {
  const real constant = a * log(real(p)) - (log_factorial(a) - log(real(a)));
  const real log_q = log(real(1 - real(p)));
  return {0, std::numeric_limits<std::int64_t>::max(),
          static_cast<std::int64_t>(std::max((a - 1) * (1 - p) / p, 0.0)),
          [=](std::int64_t y) -> real {
            return log_factorial(real(a) + y) - log(real(real(a) + y)) - log_factorial(y) +
                   y * log_q + constant;
          }};
}

// The number that a word of philox stands for.
inline double uniform(std::uint32_t word) {
  return static_cast<double>(static_cast<std::int32_t>(word)) * 0x1p-32 + 0.5;
}
inline std::uint32_t word_of(std::int64_t numerator) {
  return static_cast<std::uint32_t>(numerator) ^ 0x80000000u;
}

constexpr plain::two key{20, 26};

using draw = std::function<int(rvx_stream, std::int64_t, std::int32_t*)>;

// ---- Inversion ------------------------------------------------------------------------------

// The cumulated probabilities of the values y, least first, until the rest is below 2^-62. Values
// less likely than 2^-70 times the mode never come.
class inversion {
 public:
  explicit inversion(const law& of) : least_(of.least) {
    const real rare = ldexp(real(1), -70);
    while (of.ratio(least_) <= rare)
      ++least_;
    real sum = 0;
    for (std::int64_t y = least_; y <= of.greatest && sum < 1 - ldexp(real(1), -62); ++y)
      cdf_.push_back(sum += exp(of.log_at(y)));
  }
  // The least value whose cumulated probability is above u.
  std::int64_t operator()(double u) const {
    return least_ + (std::upper_bound(cdf_.begin(), cdf_.end(), real(u)) - cdf_.begin());
  }
  const std::vector<real>& steps() const { return cdf_; }

 private:
  std::int64_t least_;
  std::vector<real> cdf_;
};

// Words on both sides of every step, words at the ends, and a run of others; n decides how large
// a table of guides is worth its while. `from_top` is set where the values fall as u rises: the
// value is then from_top less a value of `of`.
inline void expect_inversion(const draw& routine, const law& of,
                             std::optional<std::int64_t> from_top = std::nullopt) {
  const inversion value(of);
  const auto expected = [&](std::uint32_t word) {
    const std::int64_t y = value(uniform(word));
    return from_top ? *from_top - y : y;
  };
  support::stream s;
  std::vector<std::uint32_t> words{0x80000000, 0x7FFFFFFF, 0, 0xFFFFFFFF, 1};
  for (const real& step : value.steps()) {
    const auto at = static_cast<std::int64_t>(ldexp(step, 32));
    for (const std::int64_t near : {at - 1, at, at + 1})
      if (0 <= near && near < std::int64_t{1} << 32)
        words.push_back(word_of(near));
  }
  while (words.size() % 4 != 0)
    words.push_back(7);
  for (std::size_t i = 0; i < words.size(); i += 4) {
    const plain::u128 at =
        plain::counter_of({words[i], words[i + 1], words[i + 2], words[i + 3]}, key);
    for (const std::size_t n : {std::size_t{4}, std::size_t{1500}}) {
      if (n != 4 && i % 64 != 0)
        continue;
      s.set(key, at, 0);
      support::results<std::int32_t> r(n);
      ASSERT_EQ(routine(s, static_cast<std::int64_t>(n), r.data()), 0);
      for (std::size_t j = 0; j < 4; ++j)
        ASSERT_EQ(r[j], expected(words[i + j])) << "word " << words[i + j];
      ASSERT_TRUE(r.guards_intact());
    }
  }
  for (const std::size_t n : {1u, 15u, 1023u, 1025u, 20000u}) {
    s.set(key, 5, 1);
    plain::stream model = s.position();
    support::results<std::int32_t> r(n);
    ASSERT_EQ(routine(s, static_cast<std::int64_t>(n), r.data()), 0);
    for (std::size_t i = 0; i < n; ++i)
      ASSERT_EQ(r[i], expected(model.next())) << "value " << i;
    ASSERT_TRUE(r.guards_intact());
    ASSERT_TRUE(support::same_position(s, model));
  }
}

// ---- Rejection ------------------------------------------------------------------------------

// A height of 0 is accepted whatever the value.
struct candidate {
  double y, w;
};
using propose = std::function<candidate(double u, double v)>;

// Zero counts as a number below all that the engine has.
inline double raised(double v) {
  return std::max(v, 0x1p-60);
}

class rejection {
 public:
  rejection(const law& of, propose from, std::function<std::int64_t(std::int64_t)> image)
      : law_(of), from_(std::move(from)), image_(std::move(image)) {}

  // The next value of the plain stream.
  std::int64_t next(plain::stream& words) {
    for (;; ++rejected) {
      const double u = uniform(words.next());
      const double v = uniform(words.next());
      const candidate c = from_(u, v);
      if (accepts(c))
        return image_(static_cast<std::int64_t>(std::min(c.y, 0x1p62)));
    }
  }

  std::size_t rejected = 0;
  double closest = 1;  // to a decision on the other side, in units of ln w

 private:
  bool accepts(const candidate& c) {
    if (c.y < static_cast<double>(law_.least) || c.y > static_cast<double>(law_.greatest))
      return false;
    if (c.w <= 0)
      return true;
    const auto y = static_cast<std::int64_t>(c.y);
    const real margin = law_.log_at(y) - law_.log_at(law_.mode) - log(real(c.w));
    closest = std::min(closest, std::abs(static_cast<double>(margin)));
    return margin >= 0;
  }

  const law& law_;
  propose from_;
  std::function<std::int64_t(std::int64_t)> image_;
};

inline std::int64_t as_it_is(std::int64_t y) {
  return y;
}

// Values and words of calls of several lengths, below and above the one from which ratios are
// kept; pairs of words at the ends; and a sequence cut into calls.
inline void expect_rejection(const draw& routine, const law& of, const propose& from,
                             const std::function<std::int64_t(std::int64_t)>& image = as_it_is) {
  rejection value(of, from, image);
  support::stream s;
  const auto compare = [&](std::size_t n) {
    plain::stream model = s.position();
    support::results<std::int32_t> r(n);
    ASSERT_EQ(routine(s, static_cast<std::int64_t>(n), r.data()), 0);
    for (std::size_t i = 0; i < n; ++i)
      ASSERT_EQ(r[i], value.next(model)) << "value " << i << " of " << n;
    ASSERT_TRUE(r.guards_intact());
    ASSERT_TRUE(support::same_position(s, model));
  };
  for (const std::size_t n : {1u, 2u, 7u, 16u, 100u, 255u, 256u, 1000u, 12000u}) {
    s.set(key, n, 2);
    ASSERT_NO_FATAL_FAILURE(compare(n));
  }
  EXPECT_GT(value.rejected, 100u) << "nothing to tell accepted from rejected candidates";
  // The routine decides in double: the model must not have been nearer to a decision than that.
  EXPECT_GT(value.closest, 1e-11);

  constexpr std::uint32_t ends[] = {0x80000000, 0x7FFFFFFF, 0x80000001, 0, 0xFFFFFFFF};
  for (const std::uint32_t u : ends)
    for (const std::uint32_t v : ends) {
      s.set(key, plain::counter_of({u, v, v, u}, key), 0);
      ASSERT_NO_FATAL_FAILURE(compare(3)) << u << ", " << v;
    }

  s.set(key, 99, 3);
  support::results<std::int32_t> whole(700), parts(700);
  ASSERT_EQ(routine(s, 700, whole.data()), 0);
  const support::record end = s.state();
  s.set(key, 99, 3);
  std::int32_t* to = parts.data();
  for (const std::int64_t n : {1, 2, 13, 300, 384}) {
    ASSERT_EQ(routine(s, n, to), 0);
    to += n;
  }
  EXPECT_TRUE(whole == parts);
  const support::record other = s.state();
  EXPECT_EQ(std::memcmp(&end, &other, sizeof end), 0);
}

// A constant law: n equal values, and the stream stays where it is.
inline void expect_constant(const draw& routine, std::int32_t value) {
  support::stream s;
  s.set(key, 3, 1);
  const plain::stream before = s.position();
  support::results<std::int32_t> r(300);
  ASSERT_EQ(routine(s, 300, r.data()), 0);
  for (std::size_t i = 0; i < 300; ++i)
    ASSERT_EQ(r[i], value);
  EXPECT_TRUE(r.guards_intact());
  EXPECT_TRUE(support::same_position(s, before));
}

}  // namespace counts
