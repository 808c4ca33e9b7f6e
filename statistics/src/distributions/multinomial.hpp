// SPDX-License-Identifier: Apache-2.0
// Counts of ntrial trials over categories, row by row. Few trials are drawn one by one from a
// table; of many, the count of each category is binomial given the counts before it (Davis: The
// computer generation of multinomial random variates, Computational Statistics and Data Analysis
// 16, 1993).
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "blocks.hpp"
#include "distributions/guide_table.hpp"

namespace tarn::statistics {

// Probabilities whose sum misses 1 by more than this much for each category are refused: 16 times
// what rounding each of them can do.
inline constexpr double sum_tolerance = 0x1p-49;

// Whether they are a law: none negative or not a number, and their sum next to 1.
bool is_law(const double* p, std::size_t categories);

// A binomial count costs as much as this many trials, about (measured).
inline constexpr std::int32_t trials_per_binomial = 200;

// Draw and count: ntrial words a row.
class counted_trials {
 public:
  counted_trials(std::size_t ntrial, const double* p, std::size_t categories, std::size_t rows);

  void operator()(const word_source& source, std::size_t rows, std::int32_t* out) const;

 private:
  std::size_t ntrial_, categories_;
  guide_table table_;
};

// Conditional binomials, a number of words that varies.
class conditional_counts {
 public:
  conditional_counts(std::int32_t ntrial, const double* p, std::size_t categories);

  void operator()(const word_source& source, std::size_t rows, std::int32_t* out) const;

 private:
  std::int32_t ntrial_;
  // Probability of each category given that none before it came; 1 for the last that can come.
  std::vector<double> given_;
};

}  // namespace tarn::statistics
