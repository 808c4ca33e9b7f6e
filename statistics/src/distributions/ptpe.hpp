// SPDX-License-Identifier: Apache-2.0
// Poisson variates by rejection from under a tent: algorithm PTPE (Schmeiser, Kachitvichyanukul:
// Poisson random variate generation, Research Memorandum 81-4, Purdue University, 1981), for rates
// of 10 and more, two words a candidate.
#pragma once

#include <cstddef>
#include <cstdint>

#include "distributions/hat.hpp"
#include "distributions/log_ratio.hpp"
#include "distributions/tent.hpp"

namespace tarn::statistics {

struct ptpe : tent {
  ptpe(double lambda, std::size_t uses);

  std::size_t attempt(const double* uniforms, std::size_t count, std::int32_t* out) const;

  near_ratios near;
  log_ratio ratio;
  image result;
};

}  // namespace tarn::statistics
