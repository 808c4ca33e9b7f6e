// SPDX-License-Identifier: Apache-2.0
// Set-ups of hypergeometric variates.
#include "distributions/hypergeometric.hpp"

#include <algorithm>
#include <cmath>

namespace tarn::statistics {

hypergeometric_law::hypergeometric_law(std::int32_t lot, std::int32_t sample, std::int32_t marked) {
  const bool marked_rarer = marked <= lot - marked;
  const bool sample_smaller = sample <= lot - sample;
  n1 = marked_rarer ? marked : lot - marked;
  n2 = lot - n1;
  k = sample_smaller ? sample : lot - sample;
  mode = (n1 + 1) * (k + 1) / (std::int64_t{lot} + 2);
  // Marked ones in the sample: those of the rarer kind, or the others; all of a kind less those
  // that stayed in the lot.
  falling = marked_rarer != sample_smaller;
  if (sample_smaller)
    origin = marked_rarer ? 0 : sample;
  else
    origin = marked_rarer ? marked : sample - static_cast<std::int32_t>(n1);
}

tabulated_values invert_hypergeometric(const hypergeometric_law& law, std::size_t uses) {
  const auto n1 = static_cast<double>(law.n1), k = static_cast<double>(law.k);
  const auto n2_k = static_cast<double>(law.n2 - law.k);
  return {tabulate(
              static_cast<std::int32_t>(law.mode),
              [=](double y) { return (n1 - y) * (k - y) / ((y + 1) * (n2_k + y + 1)); },
              [=](double y) { return y * (n2_k + y) / ((n1 - y + 1) * (k - y + 1)); }),
          uses, law.origin, law.falling};
}

h2pe::h2pe(const hypergeometric_law& law, std::size_t uses)
    : n1(static_cast<double>(law.n1)),
      k(static_cast<double>(law.k)),
      n2_k(static_cast<double>(law.n2 - law.k)),
      greatest(std::min(n1, k)),
      result{static_cast<double>(law.origin), law.falling ? -1.0 : 1.0} {
  const auto m = static_cast<double>(law.mode);
  const auto n2 = static_cast<double>(law.n2);
  const double lot = n1 + n2;
  // ln((n1 - m) (k - m) / (m (n2 - k + m))), whose argument is next to 1; the products are below
  // 2^63.
  const auto excess = static_cast<double>(law.n1 * law.k - law.mode * (law.n1 + law.n2));
  ratio.reference = m;
  ratio.slope = std::log1p(excess / (m * (n2_k + m)));
  ratio.shift = 0;
  ratio.add(-1, 1, m);
  ratio.add(-1, -1, n1 - m);
  ratio.add(-1, -1, k - m);
  ratio.add(-1, 1, n2_k + m);
  near.center = m;
  if (uses >= near_ratios::worth)
    near.keep(ratio);

  const double deviation = std::sqrt(k / lot * (lot - k) / (lot - 1) * n1 / lot * n2);
  const double d = std::floor(1.5 * deviation) + 0.5;
  xl = m - d + 0.5;
  xr = m + d + 0.5;
  const double kl = ratio_of(ratio, xl);
  const double kr = ratio_of(ratio, xr - 1);
  lambda_l = -std::log(xl * (n2_k + xl) / ((n1 - xl + 1) * (k - xl + 1)));
  lambda_r = -std::log((n1 - xr + 1) * (k - xr + 1) / (xr * (n2_k + xr)));
  p1 = d + d;
  p2 = p1 + kl / lambda_l;
  p3 = p2 + kr / lambda_r;
}

}  // namespace tarn::statistics
