// SPDX-License-Identifier: Apache-2.0
// Birthday spacings with few collisions expected in very many days: G. Marsaglia, A Current View of
// Random Number Generators, 1985; sizes after P. L'Ecuyer, R. Simard, On the Performance of
// Birthday Spacings Tests with Certain Families of Random Number Generators, Mathematics and
// Computers in Simulation 55, 2001: congruential generators of period r fail from some 16 r^(1/3)
// points on.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace tarn::quality {

// How many of the spacings between neighbouring points have appeared before.
std::size_t equal_spacings(std::vector<std::uint64_t> points);

// The mean of that count for n random points among 2^64 days, n^3 / (4 * 2^64).
double expected_equal_spacings(std::size_t n);

// The chance that a Poisson variable of this mean is below `count`, plus half the chance that it is
// equal: P(p <= x) and P(p >= 1 - x) are at most 2 x.
double poisson_chance(std::size_t count, double mean);

}  // namespace tarn::quality
