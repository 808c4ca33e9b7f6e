// SPDX-License-Identifier: Apache-2.0
// A sample against its law: range, Kolmogorov-Smirnov distance, Pearson's chi-square, tails, and
// the first four moments. Values are taken in portions and not kept.
//
// What is found: for n values any error of more than twice critical_distance(n) in a probability
// (0.016 for 2e5 values, 0.0023 for 1e7), a shift of 0.04 (0.006) or a wrong scale of 4 % (0.6 %)
// of the standard deviation of a Gaussian; the tests of wrong laws show it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "clamped_moments.hpp"
#include "law.hpp"

namespace laws {

// How finely results can be distributed at all.
struct grain {
  // A result x is off by relative * (|x| + place) + least at most.
  double relative, place;
  double least;        // positive normal number of the type; 0 for integers
  double probability;  // of one canonical value: F is met no better than this
  bool exact_range;    // no result lies outside the support, not even by rounding

  double at(double x) const;
};

struct finding {
  std::string test;
  double statistic, critical;  // it fails if the statistic is above the critical value
  bool failed() const { return !(statistic <= critical); }
};

class examination {
 public:
  examination(const law& expected, const grain& resolution, std::size_t n);

  void add(double x);
  // All n values have been added.
  std::vector<finding> findings() const;

 private:
  struct boundary {
    double x;                   // counts values of (boundary before, x]
    double least, exact, most;  // P(X <= x) for x moved by the resolution
  };

  void place_boundaries();
  double accumulated(std::size_t last) const;
  finding range() const;
  finding distance() const;
  finding chi_square() const;
  finding tail(std::size_t end, bool upper) const;
  finding moment(std::size_t k) const;

  law law_;
  grain grain_;
  std::size_t n_;
  double tail_;
  clamped_moments moments_;
  std::vector<boundary> boundaries_;
  std::vector<double> places_;       // of the boundaries, for the search
  std::vector<std::size_t> counts_;  // of the cells; the last one lies above all boundaries
  double sums_[4] = {};
  std::size_t outside_ = 0;  // of the support, or not finite
};

// Those that failed, one a line.
std::string failures(const std::vector<finding>& all);

}  // namespace laws
