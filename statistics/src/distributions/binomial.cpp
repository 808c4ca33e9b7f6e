// SPDX-License-Identifier: Apache-2.0
// Set-ups of binomial variates.
#include "distributions/binomial.hpp"

#include <cmath>

namespace tarn::statistics {

// 1 - p is exact above 1/2.
binomial_law::binomial_law(std::int32_t trials, double p)
    : n(trials), r(p > 0.5 ? 1 - p : p), q(p > 0.5 ? p : 1 - p), flipped(p > 0.5) {}

tabulated_values invert_binomial(const binomial_law& law, std::size_t uses) {
  const double n = law.n, odds = law.r / law.q;
  const auto mode = static_cast<std::int32_t>((n + 1) * law.r);
  return {tabulate(
              mode, [=](double k) { return (n - k) / (k + 1) * odds; },
              [=](double k) { return k == 0 ? 0 : k / ((n - k + 1) * odds); }),
          uses, law.flipped ? static_cast<std::int32_t>(n) : 0, law.flipped};
}

btpe::btpe(const binomial_law& law, std::size_t uses)
    : n(law.n),
      npq(law.n * law.r * law.q),
      result{law.flipped ? n : 0.0, law.flipped ? -1.0 : 1.0} {
  const double r = law.r, q = law.q;
  const double fm = n * r + r;
  const double m = std::floor(fm);
  p1 = std::floor(2.195 * std::sqrt(npq) - 4.6 * q) + 0.5;
  xm = m + 0.5;
  xl = xm - p1;
  xr = xm + p1;
  c = 0.134 + 20.5 / (15.3 + m);
  const double al = (fm - xl) / (fm - xl * r);
  lambda_l = al * (1 + 0.5 * al);
  const double ar = (xr - fm) / (xr * q);
  lambda_r = ar * (1 + 0.5 * ar);
  p2 = p1 * (1 + 2 * c);
  p3 = p2 + c / lambda_l;
  p4 = p3 + c / lambda_r;

  ratio.reference = m;
  // ln((n - m) r / (m q)), whose argument is next to 1. The error of n r - m counts as often as
  // there are steps from the mode.
  ratio.slope = std::log1p(std::fma(n, r, -m) / (m * q));
  ratio.shift = 0;
  ratio.add(-1, 1, m);
  ratio.add(-1, -1, n - m);
  near.center = m;
  if (uses >= near_ratios::worth)
    near.keep(ratio);
}

}  // namespace tarn::statistics
