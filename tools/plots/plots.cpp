// SPDX-License-Identifier: Apache-2.0
// The distributions with the parameters of their figures. The formulas are those of the pages,
// written in logarithms where factorials and powers would leave the range.
#include "plots.hpp"

#include <cmath>
#include <cstdint>
#include <limits>
#include <stdexcept>

namespace {

using std::exp, std::lgamma, std::log, std::log1p, std::sqrt;

constexpr double pi = 3.14159265358979323846;

void need(int status) {
  if (status != RVX_STATUS_OK)
    throw std::runtime_error("a routine gave the status " + std::to_string(status));
}

// n values by a routine of results of type Value.
template <class Value, class... Parameters>
auto by(int (*routine)(std::int64_t, rvx_stream, std::int64_t, Value*, Parameters...), int method,
        Parameters... parameters) {
  return [=](rvx_stream stream, std::size_t n) {
    std::vector<Value> values(n);
    need(routine(method, stream, static_cast<std::int64_t>(n), values.data(), parameters...));
    return std::vector<double>(values.begin(), values.end());
  };
}

double normal_density(double x, double mean, double stddev) {
  const double z = (x - mean) / stddev;
  return exp(-z * z / 2) / (stddev * sqrt(2 * pi));
}

// (n over k)
double choose(double n, double k) {
  return exp(lgamma(n + 1) - lgamma(k + 1) - lgamma(n - k + 1));
}

double poisson_probability(double k, double lambda) {
  return exp(k * log(lambda) - lambda - lgamma(k + 1));
}

double binomial_probability(double k, double ntrial, double p) {
  return choose(ntrial, k) * exp(k * log(p) + (ntrial - k) * log1p(-p));
}

// Words by a routine, as fractions of 2^bits.
template <class Word>
auto fractions_by(int (*routine)(std::int64_t, rvx_stream, std::int64_t, Word*)) {
  return [=](rvx_stream stream, std::size_t n) {
    std::vector<double> values = by(routine, RVX_RNG_METHOD_STANDARD)(stream, n);
    for (double& x : values)
      x = std::ldexp(x, -std::numeric_limits<Word>::digits);
    return values;
  };
}

// ---- Of several numbers each ----------------------------------------------------------------

// The sum of both coordinates, whose variance holds the covariance.
std::vector<double> sums_of_pairs(rvx_stream stream, std::size_t n) {
  const double mean[] = {1, -1}, factor[] = {1, 0, 0.8, 0.6};
  std::vector<double> pairs(2 * n), sums(n);
  need(rvxdRngGaussianMV(RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2, stream, static_cast<std::int64_t>(n),
                         pairs.data(), 2, 0, mean, factor));
  for (std::size_t i = 0; i < n; ++i)
    sums[i] = pairs[2 * i] + pairs[2 * i + 1];
  return sums;
}

std::vector<double> second_categories(rvx_stream stream, std::size_t n) {
  const double p[] = {0.1, 0.3, 0.6};
  std::vector<std::int32_t> rows(3 * n);
  need(rvxiRngMultinomial(RVX_RNG_METHOD_STANDARD, stream, static_cast<std::int64_t>(n),
                          rows.data(), 20, 3, p));
  std::vector<double> counts(n);
  for (std::size_t i = 0; i < n; ++i)
    counts[i] = rows[3 * i + 1];
  return counts;
}

// The rates 4 and 40 in turn.
std::vector<double> of_two_rates(rvx_stream stream, std::size_t n) {
  std::vector<double> rates(n);
  for (std::size_t i = 0; i < n; ++i)
    rates[i] = i % 2 == 0 ? 4 : 40;
  std::vector<std::int32_t> values(n);
  need(rvxiRngPoissonV(RVX_RNG_METHOD_STANDARD, stream, static_cast<std::int64_t>(n), values.data(),
                       rates.data()));
  return {values.begin(), values.end()};
}

// ---- All ------------------------------------------------------------------------------------

void add_real(std::vector<plot>& all) {
  all.push_back({"uniform", "a = 2, b = 5", false, 1.4, 5.6, by(rvxdRngUniform, 0, 2.0, 5.0),
                 [](double x) { return x >= 2 && x < 5 ? 1.0 / 3 : 0; }});
  all.push_back({"gaussian", "mean = 1, stddev = 2", false, -6, 8,
                 by(rvxdRngGaussian, RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2, 1.0, 2.0),
                 [](double x) { return normal_density(x, 1, 2); }});
  all.push_back({"gaussian_mv", "sum of both coordinates", false, -6, 6, sums_of_pairs,
                 [](double x) { return normal_density(x, 0, sqrt(1 + 1 + 2 * 0.8)); }});
  all.push_back(
      {"lognormal", "m = 0, s = 0.5, displ = 1, scale = 2", false, 0, 8,
       by(rvxdRngLognormal, RVX_RNG_METHOD_LOGNORMAL_BOXMULLER2, 0.0, 0.5, 1.0, 2.0),
       [](double x) { return x > 1 ? normal_density(log((x - 1) / 2), 0, 0.5) / (x - 1) : 0; }});
  all.push_back({"exponential", "a = 1, beta = 2", false, 0, 14,
                 by(rvxdRngExponential, 0, 1.0, 2.0),
                 [](double x) { return x >= 1 ? exp(-(x - 1) / 2) / 2 : 0; }});
  all.push_back({"gamma", "alpha = 2.5, a = 0, beta = 2", false, 0, 18,
                 by(rvxdRngGamma, 0, 2.5, 0.0, 2.0),
                 [](double x) { return exp(1.5 * log(x / 2) - x / 2 - lgamma(2.5)) / 2; }});
  all.push_back({"beta", "p = 2, q = 5, a = -1, b = 3", false, -1, 2,
                 by(rvxdRngBeta, 0, 2.0, 5.0, -1.0, 3.0), [](double x) {
                   const double u = (x + 1) / 3;
                   const double log_power = log(u) + 4 * log1p(-u);
                   return exp(lgamma(7) - lgamma(2) - lgamma(5) + log_power) / 3;
                 }});
  all.push_back({"chi_square", "n = 5", false, 0, 20, by(rvxdRngChiSquare, 0, std::int32_t{5}),
                 [](double x) { return exp(1.5 * log(x / 2) - x / 2 - lgamma(2.5)) / 2; }});
  all.push_back({"weibull", "alpha = 1.5, a = 0, beta = 2", false, 0, 8,
                 by(rvxdRngWeibull, 0, 1.5, 0.0, 2.0),
                 [](double x) { return 0.75 * sqrt(x / 2) * exp(-std::pow(x / 2, 1.5)); }});
  all.push_back({"rayleigh", "a = 0, b = 2", false, 0, 6, by(rvxdRngRayleigh, 0, 0.0, 2.0),
                 [](double x) { return x / 2 * exp(-x * x / 4); }});
  all.push_back(
      {"gumbel", "a = 1, b = 2", false, -12, 6, by(rvxdRngGumbel, 0, 1.0, 2.0), [](double x) {
         const double z = (x - 1) / 2;
         return exp(z - exp(z)) / 2;
       }});
  all.push_back({"laplace", "a = 1, b = 2", false, -10, 12, by(rvxdRngLaplace, 0, 1.0, 2.0),
                 [](double x) { return exp(-std::fabs(x - 1) / 2) / 4; }});
  all.push_back(
      {"cauchy", "a = 1, b = 2", false, -15, 17, by(rvxdRngCauchy, 0, 1.0, 2.0), [](double x) {
         const double z = (x - 1) / 2;
         return 1 / (2 * pi * (1 + z * z));
       }});
  all.push_back({"bits", "words of philox4x32x10 / 2^32", false, 0, 1,
                 fractions_by(rvxiRngUniformBits), [](double) { return 1.0; }});
  all.push_back({"uniform_bits", "64 bits / 2^64", false, 0, 1, fractions_by(rvxiRngUniformBits64),
                 [](double) { return 1.0; }});
}

void add_integer(std::vector<plot>& all) {
  all.push_back({"poisson", "lambda = 40", true, 15, 70,
                 by(rvxiRngPoisson, RVX_RNG_METHOD_POISSON_GAUSSIAN_ICDF, 40.0),
                 [](double k) { return poisson_probability(k, 40); }});
  all.push_back({"poisson_v", "lambda = 4 and 40 in turn", true, 0, 65, of_two_rates, [](double k) {
                   return (poisson_probability(k, 4) + poisson_probability(k, 40)) / 2;
                 }});
  all.push_back({"binomial", "ntrial = 100, p = 0.3", true, 10, 50,
                 by(rvxiRngBinomial, 0, std::int32_t{100}, 0.3),
                 [](double k) { return binomial_probability(k, 100, 0.3); }});
  all.push_back({"negative_binomial", "a = 2.5, p = 0.2", true, 0, 40,
                 by(rvxiRngNegbinomial, 0, 2.5, 0.2), [](double k) {
                   const double log_power = 2.5 * log(0.2) + k * log(0.8);
                   return exp(lgamma(k + 2.5) - lgamma(2.5) - lgamma(k + 1) + log_power);
                 }});
  all.push_back(
      {"hypergeometric", "l = 1000, s = 200, m = 300", true, 35, 85,
       by(rvxiRngHypergeometric, 0, std::int32_t{1000}, std::int32_t{200}, std::int32_t{300}),
       [](double k) { return choose(300, k) * choose(700, 200 - k) / choose(1000, 200); }});
  all.push_back({"multinomial", "count of p[1] = 0.3, ntrial = 20", true, 0, 16, second_categories,
                 [](double k) { return binomial_probability(k, 20, 0.3); }});
  all.push_back({"geometric", "p = 0.2", true, 0, 30, by(rvxiRngGeometric, 0, 0.2),
                 [](double k) { return 0.2 * std::pow(0.8, k); }});
  all.push_back({"bernoulli", "p = 0.3", true, -1, 2, by(rvxiRngBernoulli, 0, 0.3), [](double k) {
                   return k == 0 ? 0.7 : k == 1 ? 0.3 : 0;
                 }});
}

}  // namespace

std::vector<plot> every_plot() {
  std::vector<plot> all;
  add_real(all);
  add_integer(all);
  return all;
}
