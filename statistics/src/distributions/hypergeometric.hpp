// SPDX-License-Identifier: Apache-2.0
// Hypergeometric variates. By symmetries the marked elements become the rarer kind and the sample
// at most half the lot. Where the mode is then at least 40 by the algorithm H2PE
// (Kachitvichyanukul, Schmeiser: Computer generation of hypergeometric random variates, J. Stat.
// Comput. Simul. 22, 1985), two words a candidate; else by inversion, one word a value.
#pragma once

#include <cstddef>
#include <cstdint>

#include "blocks.hpp"
#include "distributions/hat.hpp"
#include "distributions/log_ratio.hpp"
#include "distributions/tabulated_law.hpp"

namespace tarn::statistics {

// `sample` elements of `lot`, of which `marked` are marked.
struct hypergeometric_law {
  hypergeometric_law(std::int32_t lot, std::int32_t sample, std::int32_t marked);

  bool constant() const { return n1 == 0 || k == 0; }
  bool by_table() const { return mode < 40; }

  std::int64_t n1, n2;  // elements of the rarer and of the other kind
  std::int64_t k;       // drawn ones
  std::int64_t mode;    // of the count y of rarer ones among them
  std::int32_t origin;  // the result is origin + y, or origin - y where `falling`
  bool falling;
};

// Inversion for laws with by_table().
tabulated_values invert_hypergeometric(const hypergeometric_law& law, std::size_t uses);

// H2PE, with the names of the paper. The hat is a rectangle around the mode and two exponential
// tails.
struct h2pe {
  h2pe(const hypergeometric_law& law, std::size_t uses);

  std::size_t attempt(const double* uniforms, std::size_t count, std::int32_t* out) const;

  double n1, k, n2_k;  // n2_k: n2 - k
  double greatest;     // value
  double xl, xr, p1, p2, p3;
  double lambda_l, lambda_r;
  near_ratios near;
  log_ratio ratio;
  image result;
};

}  // namespace tarn::statistics
