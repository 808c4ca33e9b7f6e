// SPDX-License-Identifier: Apache-2.0
// Tables of cumulative probabilities, built as the library builds those of binomial, hypergeometric
// and negative_binomial on GPU queues: the order of the sums is part of the results.
#pragma once

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <vector>

#include <sycl/sycl.hpp>

namespace tarn_test {

/// The first entry above u; the size of the table where there is none.
inline std::size_t first_above(const std::vector<double>& cdf, double u) {
  std::size_t k = 0;
  while (k < cdf.size() && !(u < cdf[k])) {
    ++k;
  }
  return k;
}

/// Summed from the top, for the rarer of success and failure. It ends 31 above the mean at a sum
/// that is not 1; the library has room for 64 entries.
inline std::vector<double> binomial_cdf(std::int32_t ntrial, double p) {
  const double n = ntrial;
  const double r = p < 0.5 ? p : 1 - p;
  const double q = p < 0.5 ? 1 - p : p;
  const double s = r / q;
  const double a = (n + 1) * s;
  const auto size = static_cast<std::size_t>(static_cast<std::int32_t>(r * n)) + 32;
  std::vector<double> pmf = {sycl::powr(q, n)};
  for (std::size_t k = 1; k < size; ++k) {
    pmf.push_back(pmf.back() * (a / static_cast<double>(k) - s));
  }
  std::vector<double> from(size + 1, 0);  // sums from the top
  for (std::size_t k = size; k-- > 0;) {
    from[k] = from[k + 1] + pmf[k];
  }
  std::vector<double> cdf;
  for (std::size_t k = 0; k < size; ++k) {
    cdf.push_back(from[0] - from[k + 1]);
  }
  return cdf;
}

/// ln(x!)
inline double log_factorial(double x) {
  if (x <= 15) {
    return static_cast<double>(std::lgamma(static_cast<long double>(x) + 1));
  }
  const double i = 1.0 / x;
  return (-0.0027777777777777779 * i * i + 0.083333333333333329) * i +
         (sycl::log(x) * (0.5 + x) - x + 0.91893853319999996);
}

/// Of k items out of n1 marked ones and n2 >= k others, with the mode given: summed up to the mode
/// from below, and behind it from 1 downwards. It ends where terms no longer change a sum of 1.
inline std::vector<double> hypergeometric_cdf(double n1, double n2, double k, std::size_t mode) {
  std::vector<double> pmf = {sycl::exp(log_factorial(n2) + log_factorial(n1 + n2 - k) -
                                       log_factorial(n2 - k) - log_factorial(n1 + n2))};
  for (double f = 0;; f += 1.0) {
    const double t = ((k - f) * (n1 - f)) / (((n2 - k + f) + 1.0) * (f + 1.0)) * pmf.back();
    if (pmf.size() >= mode && std::numeric_limits<double>::epsilon() > t) {
      break;
    }
    pmf.push_back(t);
  }
  std::vector<double> cdf(pmf.size());
  cdf[0] = pmf[0];
  for (std::size_t i = 1; i <= mode; ++i) {
    cdf.at(i) = cdf[i - 1] + pmf.at(i);
  }
  cdf.back() = 1.0;
  for (std::size_t i = cdf.size() - 2; i > mode && i < cdf.size(); --i) {
    cdf[i] = cdf[i + 1] - pmf[i + 1];
  }
  return cdf;
}

/// 128 entries more than the mode has, or 128.
inline std::vector<double> negative_binomial_cdf(double a, double p) {
  const double q = 1 - p;
  const double mode = std::fmax(std::trunc((a - 1) * (1 - p) / p), 0.0);
  std::vector<double> cdf;
  double pmf = sycl::powr(p, a);
  double cum = 0;
  for (double k = 0; k < mode + 128; k += 1) {
    cum += pmf;
    cdf.push_back(cum);
    pmf = (a + k) * q * pmf / (k + 1);
  }
  return cdf;
}

}  // namespace tarn_test
