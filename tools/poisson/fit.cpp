// SPDX-License-Identifier: Apache-2.0
// Only where x passes an integer k counts: at the deviate z_k of P(X <= k) it should be k. The
// errors there are weighed by the root of the probability between neighbours, so that the sum of
// their squares is about the mean square error of x. A weight of the probability itself would bring
// the middle of the law a little closer and let go of the tails.
#include "fit.hpp"

#include <algorithm>
#include <cmath>
#include <vector>

#include "least_squares.hpp"

namespace poisson {

namespace {

constexpr int rates_of_octave = 20;

// Of the order of a probability that may be off by the size of a total variation: enough to hold x
// below 0 where the result is 0, and next to nothing against the values.
constexpr real weight_below_zero = 1e-3L;
constexpr real step_below_zero = 0.25L;

struct rate {
  real lambda, t;
};

// From `first` to first * (1 + t_end), both included, in equal ratios.
std::vector<rate> rates_from(real first, real t_end) {
  std::vector<rate> rates;
  for (int i = 0; i < rates_of_octave; ++i) {
    const real t = std::pow(1 + t_end, real(i) / (rates_of_octave - 1)) - 1;
    rates.push_back({first * (1 + t), t});
  }
  return rates;
}

template <std::size_t terms>
std::array<real, terms> powers(real t) {
  std::array<real, terms> p{1};
  for (std::size_t i = 1; i < terms; ++i)
    p[i] = p[i - 1] * t;
  return p;
}

template <class Coefficient>
real polynomial(const Coefficient* c, int terms, real t) {
  real sum = 0;
  while (terms > 0)
    sum = sum * t + c[--terms];
  return sum;
}

// The polynomial in t of least relative error in proportion to the rate, rounded to Coefficient.
template <std::size_t terms, class Coefficient, class Function>
void fit_in_t(const std::vector<rate>& rates, const Function& f, Coefficient* out) {
  least_squares<terms> system;
  for (const rate& r : rates)
    system.add(powers<terms>(r.t), f(r.lambda), 1 / r.lambda);
  const auto x = system.solution();
  std::transform(x.begin(), x.end(), out, [](real c) { return static_cast<Coefficient>(c); });
}

struct point {
  real z, x, weight;
};

// What x should be for one rate. Of large rates about six values to a deviation are enough.
std::vector<point> points_of(real lambda) {
  std::vector<point> points;
  const real first = std::max<real>(0, std::ceil(inverse(-greatest_deviate, lambda)));
  const real step = std::max<real>(1, std::floor(std::sqrt(lambda) / 6));
  for (real k = first; deviate(k, lambda) < greatest_deviate; k += step)
    points.push_back({deviate(k, lambda), k, 0});
  for (point& p : points) {
    const real cell = deviate(p.x + step / 2, lambda) - deviate(p.x - step / 2, lambda);
    p.weight = std::sqrt(normal_density(p.z) * cell);
  }
  if (first == 0) {
    const real zero = points.front().z;
    for (real z = -greatest_deviate; z < zero; z += step_below_zero)
      points.push_back({z, inverse(z, lambda), weight_below_zero});
  }
  return points;
}

// The cubics P1 to P4, one after the other. Errors of x count in units of the scale.
template <class Coefficient, class Curve>
void fit_factors(const std::vector<rate>& rates, const Curve& curve_of, Coefficient* out) {
  least_squares<16> system;
  for (const rate& r : rates) {
    const curve at = curve_of(r.lambda);
    const auto p = powers<4>(r.t);
    for (const point& goal : points_of(r.lambda)) {
      std::array<real, 16> row;
      real factor = goal.z;
      for (std::size_t i = 0; i < 16; ++i) {
        row[i] = factor * p[i % 4];
        factor *= i % 4 == 3 ? goal.z : 1;
      }
      system.add(row, (goal.x - at.centre) / at.scale, goal.weight);
    }
  }
  const auto x = system.solution();
  std::transform(x.begin(), x.end(), out, [](real c) { return static_cast<Coefficient>(c); });
}

real median(real lambda) {
  return inverse(0, lambda);
}

// The scale of the formula that kernels take from a rate of 100 on. It holds from 1 on, and rates
// on both sides of 100 have the same scale by it.
real large_rate_scale(real lambda) {
  const real i = 1 / lambda;
  return std::sqrt(lambda - 0.0558066778L +
                   i * (-0.000975814823L + i * (-0.00553485425L + i * 0.00519830827L)));
}

// The derivative of the inverse at the median.
real slope(real lambda) {
  const real h = 0x1p-6L;
  return (inverse(h, lambda) - inverse(-h, lambda)) / (2 * h);
}

template <class Coefficient>
std::array<real, 4> factors_at(const Coefficient* c, real t) {
  std::array<real, 4> p;
  for (std::size_t i = 0; i < 4; ++i)
    p[i] = polynomial(c + 4 * i, 4, t);
  return p;
}

// The fraction of the rate's mantissa.
real fraction(real lambda) {
  return std::ldexp(lambda, -std::ilogb(lambda)) - 1;
}

}  // namespace

real curve::operator()(real z) const {
  return centre + scale * z * polynomial(factors.data(), 4, z);
}

// t is the fraction of the row even at the end of the octave, where the mantissa begins anew.
static curve medium_curve_at(const medium_row& row, real t) {
  return {polynomial(row.data(), 3, t), polynomial(row.data() + 3, 4, t),
          factors_at(row.data() + 7, t)};
}
static curve wide_curve_at(const wide_row& row, real lambda, real t) {
  return {lambda + polynomial(row.data(), 2, t), std::sqrt(lambda) + polynomial(&row[2], 2, t),
          factors_at(&row[4], t)};
}

curve medium_curve(const medium_row& row, real lambda) {
  return medium_curve_at(row, fraction(lambda));
}
curve wide_curve(const wide_row& row, real lambda) {
  return wide_curve_at(row, lambda, fraction(lambda));
}

medium_row fit_medium(int e) {
  const real first = std::ldexp(1.0L, e);
  const auto rates = rates_from(first, std::min<real>(1, medium_end / first - 1));
  medium_row row{};
  fit_in_t<3>(rates, median, &row[0]);
  fit_in_t<4>(rates, large_rate_scale, &row[3]);
  fit_factors(
      rates, [&](real lambda) { return medium_curve_at(row, lambda / first - 1); }, &row[7]);
  return row;
}

// The last row serves all octaves from its own on, in which the deviations from a normal law go to
// nothing. It lies between the first of them and one where nothing is left: so the error is the
// same at both ends, half of what the other choice would leave at one of them.
wide_row fit_wide(int e) {
  constexpr real far_octaves = 0x1p17L;
  const real first = std::ldexp(1.0L, e - 4);
  auto rates = rates_from(first, 1);
  const auto t_of = [&](real lambda) {
    return lambda / (lambda >= far_octaves * first ? far_octaves * first : first) - 1;
  };
  if (e == wide_rows - 1) {
    for (const rate& far : rates_from(far_octaves * first, 1))
      rates.push_back(far);
  }
  wide_row row{};
  fit_in_t<2>(
      rates, [](real lambda) { return median(lambda) - lambda; }, &row[0]);
  fit_in_t<2>(
      rates, [](real lambda) { return slope(lambda) - std::sqrt(lambda); }, &row[2]);
  fit_factors(
      rates, [&](real lambda) { return wide_curve_at(row, lambda, t_of(lambda)); }, &row[4]);
  return row;
}

real total_variation(const curve& x, real lambda) {
  const real last = std::ceil(inverse(greatest_deviate, lambda)) + 3;
  real sum = 0, law_before = 0, before = 0;
  for (real k = std::max<real>(0, std::floor(inverse(-greatest_deviate, lambda)) - 3); k < last;
       ++k) {
    const real law = normal_cdf(deviate(k, lambda));
    real low = -greatest_deviate, high = greatest_deviate;
    for (int i = 0; i < 50; ++i) {
      const real z = (low + high) / 2;
      (x(z) < k ? low : high) = z;
    }
    const real reached = x(greatest_deviate) < k ? 1 : normal_cdf(low);
    sum += std::fabs((reached - before) - (law - law_before));
    before = reached;
    law_before = law;
  }
  return sum / 2;
}

real largest_deviation(const curve& x, real lambda) {
  real largest = 0;
  for (const point& p : points_of(lambda))
    if (p.x >= 0 && std::fabs(p.z) <= 3)
      largest = std::max(largest, std::fabs(x(p.z) - p.x) / x.scale);
  return largest;
}

}  // namespace poisson
