// SPDX-License-Identifier: Apache-2.0
// Poisson variates by rejection from a hat of a triangle, a parallelogram and two exponential
// tails: algorithm PTPE (Schmeiser, Kachitvichyanukul: Poisson random variate generation, Research
// Memorandum 81-4, Purdue University, 1981), for rates of 10 and more, two words a candidate.
#pragma once

#include <cstddef>
#include <cstdint>

#include "distributions/hat.hpp"
#include "distributions/log_ratio.hpp"

namespace tarn::statistics {

struct ptpe {
  ptpe(double lambda, std::size_t uses);

  std::size_t attempt(const double* uniforms, std::size_t count, std::int32_t* out) const;

  // Areas, summed: the triangle, which lies below the law and is accepted at sight, the halves of
  // the parallelogram around it, the left and the right tail.
  double p1, p2, p3, p4;
  double xm, xl, xr;  // middle and ends of the base of the triangle; p1 is half of it as well
  double c;           // height of the parallelogram's sides and of the right tail
  double lambda_l, lambda_r;
  near_ratios near;
  log_ratio ratio;
  image result;
};

}  // namespace tarn::statistics
