// SPDX-License-Identifier: Apache-2.0
#include "critical.hpp"

#include <algorithm>
#include <cmath>

#include <boost/math/distributions/binomial.hpp>
#include <boost/math/distributions/chi_squared.hpp>

namespace laws {

namespace {

const double log_alpha = std::log(2 / alpha);

}  // namespace

double critical_distance(std::size_t n) {
  return std::sqrt(log_alpha / (2 * static_cast<double>(n)));
}

double critical_chi_square(std::size_t cells) {
  const boost::math::chi_squared law(static_cast<double>(cells - 1));
  return quantile(complement(law, alpha));
}

double critical_mean(std::size_t n, double variance, double reach) {
  const double l = log_alpha / static_cast<double>(n);
  const double b = l * reach / 3;
  return b + std::sqrt(b * b + 2 * l * variance);
}

bool count_is_possible(std::size_t count, std::size_t n, double p_least, double p_most) {
  const auto c = static_cast<double>(count), total = static_cast<double>(n);
  const boost::math::binomial fewest(total, std::clamp(p_least, 0.0, 1.0));
  const boost::math::binomial most(total, std::clamp(p_most, 0.0, 1.0));
  if (cdf(fewest, c) < alpha / 2)
    return false;
  return count == 0 || cdf(complement(most, c - 1)) >= alpha / 2;
}

std::size_t& tests_made() {
  static std::size_t made = 0;
  return made;
}

}  // namespace laws
