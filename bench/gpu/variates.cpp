// SPDX-License-Identifier: Apache-2.0
// The laws of the variates, and the check of values against them.
#include "variates.hpp"

#include <cmath>
#include <cstdint>
#include <cstring>
#include <stdexcept>
#include <string>

namespace gpu_bench {
namespace {

struct law {
  double mean;
  double variance;
  double kurtosis;  // fourth central moment over the square of the variance
};

law uniform_law(double width) {
  return {width / 2, width * width / 12, 1.8};
}

law lognormal_law() {
  const double w = std::exp(lognormal_deviation * lognormal_deviation);
  const double mean = std::exp(lognormal_mean) * std::sqrt(w);
  return {mean, mean * mean * (w - 1), w * w * w * w + 2 * w * w * w + 3 * w * w - 3};
}

struct record {
  const char* name;
  std::size_t bytes;
  law expected;
};

const record& record_of(variate what) {
  static const record records[] = {
      {"words", sizeof(std::uint32_t), uniform_law(0x1p32)},
      {"uniform_float", sizeof(float), uniform_law(1)},
      {"uniform_double", sizeof(double), uniform_law(1)},
      {"gaussian_float", sizeof(float), {0, 1, 3}},
      {"gaussian_double", sizeof(double), {0, 1, 3}},
      {"lognormal_float", sizeof(float), lognormal_law()},
      {"lognormal_double", sizeof(double), lognormal_law()},
      {"poisson", sizeof(std::int32_t), {poisson_rate, poisson_rate, 3 + 1 / poisson_rate}},
  };
  return records[static_cast<std::size_t>(what)];
}

// Moments about the mean of the law, and how many values were never written.
struct tally {
  double first = 0;
  double second = 0;
  std::size_t left_out = 0;
};

template <typename Value>
tally tally_of(const void* values, std::size_t n, double mean) {
  Value mark;
  std::memset(&mark, unwritten, sizeof mark);
  const auto* from = static_cast<const Value*>(values);
  tally sums;
  for (std::size_t i = 0; i < n; ++i) {
    if (std::memcmp(&from[i], &mark, sizeof mark) == 0) {
      ++sums.left_out;
      continue;
    }
    const double deviation = static_cast<double>(from[i]) - mean;
    sums.first += deviation;
    sums.second += deviation * deviation;
  }
  sums.first /= static_cast<double>(n);
  sums.second /= static_cast<double>(n);
  return sums;
}

tally tally_of(variate what, const void* values, std::size_t n, double mean) {
  switch (what) {
    case variate::words:
      return tally_of<std::uint32_t>(values, n, mean);
    case variate::poisson:
      return tally_of<std::int32_t>(values, n, mean);
    default:
      return size_of(what) == sizeof(double) ? tally_of<double>(values, n, mean)
                                             : tally_of<float>(values, n, mean);
  }
}

// NaN is not near anything.
void check_near(const char* name, double found, double asked, double tolerance) {
  if (!(std::abs(found - asked) <= tolerance))
    throw std::runtime_error(std::string(name) + " " + std::to_string(found) + " instead of " +
                             std::to_string(asked) + " within " + std::to_string(tolerance));
}

}  // namespace

const char* name_of(variate what) {
  return record_of(what).name;
}
std::size_t size_of(variate what) {
  return record_of(what).bytes;
}

void check_drawn(variate what, const void* values, std::size_t n) {
  const law& expected = record_of(what).expected;
  const tally found = tally_of(what, values, n, expected.mean);
  // A word may be all ones by chance: the largest call, 2^29 words, has more than 6 such words with
  // a probability below 1e-10.
  const std::size_t allowed = what == variate::words ? 6 : 0;
  if (found.left_out > allowed)
    throw std::runtime_error(std::to_string(found.left_out) + " values were not written");
  // Eight standard errors, which independent values pass but for once in 1e15. An approximation by
  // inversion in float, as that of poisson, may be off by 1e-3 in total variation; a probability of
  // 1e-3 at five deviations moves the mean by 0.005 deviations and the variance by 0.025.
  const double deviation = std::sqrt(expected.variance);
  const double count = static_cast<double>(n);
  const bool approximate = what == variate::poisson;
  check_near("mean", found.first + expected.mean, expected.mean,
             deviation * (8 / std::sqrt(count) + (approximate ? 0.005 : 0.0)));
  check_near("variance", found.second, expected.variance,
             expected.variance *
                 (8 * std::sqrt((expected.kurtosis - 1) / count) + (approximate ? 0.025 : 0.0)));
}

}  // namespace gpu_bench
