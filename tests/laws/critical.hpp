// SPDX-License-Identifier: Apache-2.0
// When a statistic is too far from its law. The whole suite gives a false alarm with a probability
// below 1e-6: that is shared out evenly among all of its tests, and the critical values follow.
//
// Seeds are fixed, so a run that passed passes again; the budget is what makes a failure after a
// change, on another engine or with another seed mean something.
#pragma once

#include <cstddef>

namespace laws {

inline constexpr double false_alarms = 1e-6;
inline constexpr std::size_t programs = 25, tests_of_a_program = 8000;
inline constexpr double alpha = false_alarms / (programs * tests_of_a_program);

// Kolmogorov-Smirnov distance of n values. Bound of Dvoretzky, Kiefer and Wolfowitz with Massart's
// constant (1990): P(D > d) <= 2 exp(-2 n d^2), for every n and every law, discrete ones too.
double critical_distance(std::size_t n);

// Pearson's statistic of k cells, from the chi-square law of k - 1 degrees. Cells expect 200 values
// at least: then the moments of the statistic differ from that law's by 1 / 200 of themselves.
double critical_chi_square(std::size_t cells);
inline constexpr double least_expected = 200;

// Mean of n values of this variance, none further than `reach` from its expectation. Bernstein's
// inequality: P(|mean| > t) <= 2 exp(-n t^2 / (2 (variance + reach t / 3))), for every n.
double critical_mean(std::size_t n, double variance, double reach);

// Whether `count` of n values may have an event of a probability between p_least and p_most: the
// tails of the binomial law are exact.
bool count_is_possible(std::size_t count, std::size_t n, double p_least, double p_most);

// Statistical tests that this process has made; each program checks that they stay within its
// share.
std::size_t& tests_made();

}  // namespace laws
