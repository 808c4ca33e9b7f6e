// SPDX-License-Identifier: Apache-2.0
// The cdf of an integer law from the ratios of neighbouring probabilities: the probabilities
// relative to the one of the mode, summed and divided by their sum. No factorial, power or
// exponential is computed, so each entry is right to a few units of 2^-53 however large the
// parameters are.
#pragma once

#include <algorithm>
#include <cstdint>
#include <vector>

#include "distributions/guide_table.hpp"

namespace tarn::statistics {

// A law on first, first + 1, ...: P(X <= first + i) = cdf[i]. The cdf ends with 1.
struct tabulated_law {
  std::int32_t first;
  std::vector<double> cdf;
};

// up(k) = P(k + 1) / P(k) and down(k) = P(k - 1) / P(k), 0 at the ends of the law. Values less
// likely than 2^-70 times the mode are left out: even those of the slowest tail that is tabulated,
// a geometric one that loses a 64th from value to value, weigh less than 2^-60 together, which no
// word of 32 bits sees.
template <class Up, class Down>
tabulated_law tabulate(std::int32_t mode, const Up& up, const Down& down) {
  constexpr double negligible = 0x1p-70;
  std::vector<double> weights;
  std::int32_t first = mode;
  for (double weight = down(mode); weight > negligible; weight *= down(first)) {
    weights.push_back(weight);
    --first;
  }
  std::reverse(weights.begin(), weights.end());
  std::int32_t last = mode;
  for (double weight = 1; weight > negligible; ++last) {
    weights.push_back(weight);
    weight *= up(last);
  }
  double total = 0;
  for (double& weight : weights)
    weight = total += weight;
  for (double& sum : weights)
    sum /= total;
  return {first, std::move(weights)};
}

// Values of a tabulated law, one word each: origin + value, or origin - value where `falling`.
class tabulated_values {
 public:
  tabulated_values(tabulated_law law, std::size_t uses, std::int32_t origin, bool falling)
      : table_(std::move(law.cdf), uses),
        origin_(falling ? origin - law.first : origin + law.first),
        step_(falling ? -1 : 1) {}

  void operator()(const double* u, std::size_t n, std::int32_t* out) const {
    table_.look_up(u, n, out);
    for (std::size_t i = 0; i < n; ++i)
      out[i] = origin_ + step_ * out[i];
  }

 private:
  guide_table table_;
  std::int32_t origin_, step_;
};

}  // namespace tarn::statistics
