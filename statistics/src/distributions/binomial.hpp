// SPDX-License-Identifier: Apache-2.0
// Binomial variates. Where the lesser of the two expected counts is at least 30 by the algorithm
// BTPE (Kachitvichyanukul, Schmeiser: Binomial random variate generation, Comm. ACM 31, 1988), two
// words a candidate; else by inversion, one word a value. Both work on the less likely outcome.
#pragma once

#include <cstddef>
#include <cstdint>

#include "blocks.hpp"
#include "distributions/hat.hpp"
#include "distributions/log_ratio.hpp"
#include "distributions/tabulated_law.hpp"
#include "distributions/tent.hpp"

namespace tarn::statistics {

struct binomial_law {
  binomial_law(std::int32_t trials, double p);

  bool constant() const { return r == 0; }
  bool by_table() const { return n * r < 30; }

  double n;
  double r, q;   // probabilities of the less and of the more likely outcome
  bool flipped;  // the less likely outcome is the failure
};

// Inversion for laws with by_table().
tabulated_values invert_binomial(const binomial_law& law, std::size_t uses);

// BTPE, with the names of the paper.
struct btpe : tent {
  btpe(const binomial_law& law, std::size_t uses);

  std::size_t attempt(const double* uniforms, std::size_t count, std::int32_t* out) const;

  double n, npq;
  near_ratios near;
  log_ratio ratio;
  image result;
};

}  // namespace tarn::statistics
