// SPDX-License-Identifier: Apache-2.0
// What is drawn on a GPU by both sides of a comparison, with the same parameters; and the check
// that a call has drawn it, since a road that leaves values out or draws something else is no peer.
#pragma once

#include <cstddef>

namespace gpu_bench {

enum class variate {
  words,          // 32 bits
  uniform_float,  // of (0, 1)
  uniform_double,
  gaussian_float,  // mean 0, deviation 1
  gaussian_double,
  lognormal_float,  // of lognormal_mean and lognormal_deviation
  lognormal_double,
  poisson,  // of poisson_rate, 32 bits
};

constexpr double lognormal_mean = 0.0;
constexpr double lognormal_deviation = 0.5;
constexpr double poisson_rate = 10.0;

constexpr variate all_variates[] = {
    variate::words,
    variate::uniform_float,
    variate::uniform_double,
    variate::gaussian_float,
    variate::gaussian_double,
    variate::lognormal_float,
    variate::lognormal_double,
    variate::poisson,
};

/// As it is spelled above.
const char* name_of(variate what);
/// The bytes of one value.
std::size_t size_of(variate what);

/// The byte that memory is filled with before a call that is checked. Real numbers of these bytes
/// are not numbers, integers are -1.
constexpr int unwritten = 0xFF;

/// Raises std::runtime_error unless all `n` values (host memory, aligned for their type) were
/// written and have the mean and the variance of the law.
void check_drawn(variate what, const void* values, std::size_t n);

}  // namespace gpu_bench
