// SPDX-License-Identifier: Apache-2.0
// Set-up of Poisson variates by rejection.
#include "distributions/ptpe.hpp"

#include <algorithm>
#include <cmath>

#include "distributions/poisson.hpp"

namespace tarn::statistics {

ptpe::ptpe(double rate, std::size_t uses) : result{0, 1} {
  const double mean = std::min(rate, greatest_rate);
  const double m = std::floor(mean);
  p1 = std::floor(2.195 * std::sqrt(m) - 2.2) + 0.5;
  xm = m + 0.5;
  xl = xm - p1;
  xr = xm + p1;
  c = 0.133 + 8.56 / (6.83 + m);
  const auto slope = [](double a) { return a * (1 + 0.5 * a); };
  lambda_l = slope((mean - xl) / mean);
  lambda_r = slope((xr - mean) / xr);
  p2 = p1 * (1 + 2 * c);
  p3 = p2 + (0.109 + 8.25 / (10.86 + m)) / lambda_l;
  p4 = p3 + c / lambda_r;

  ratio.reference = m;
  // ln(mean / m), whose argument is next to 1
  ratio.slope = std::log1p((mean - m) / m);
  ratio.shift = 0;
  ratio.add(-1, 1, m);
  near.center = m;
  if (uses >= near_ratios::worth)
    near.keep(ratio);
}

}  // namespace tarn::statistics
