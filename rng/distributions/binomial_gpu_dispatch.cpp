// SPDX-License-Identifier: Apache-2.0
// The set-up of binomial on the host: the table of a law with a small mean, and the hat of the
// others. The order of each expression is part of the results.
#include "distributions/binomial_gpu_dispatch.hpp"

#include <array>
#include <cmath>
#include <cstddef>

namespace kestrel::tarn::rng::detail::gpu {

namespace {

/// Entries behind the truncated mean, with its own, that are made of a table. The mean is below 30:
/// 61 entries at most.
constexpr std::size_t behind_mean = 32;

/// Sums of the probabilities of the first `size` counts, as total less what is behind, so that each
/// has the accuracy of the nearer end. The table ends at the total as computed: not normalised.
/// Returns the last of the probabilities.
double sum_up(service::_bcdf_params& table, std::size_t size, double pmf_at_0) {
  std::array<double, 64> sums;  // of the probabilities from each count on
  sums[0] = pmf_at_0;
  for (std::size_t k = 1; k < size; ++k) {
    sums[k] = sums[k - 1] * (table.a / static_cast<double>(k) - table.s);
  }
  const double last = sums[size - 1];
  for (std::size_t k = size - 1; k > 0; --k) {
    sums[k - 1] = sums[k] + sums[k - 1];
  }
  for (std::size_t k = 0; k + 1 < size; ++k) {
    table.cdf[k] = sums[0] - sums[k + 1];
  }
  table.cdf[size - 1] = sums[0];
  return last;
}

/// The entries behind the first `size` go on by the law's recurrence, as kernels do behind the last
/// one: so uniforms above the total find the counts that they would find if the walk began there.
/// With anything else, such as zeros, these counts would be missing, or the walk without an end.
void continue_sums(service::_bcdf_params& table, std::size_t size, double pm) {
  for (std::size_t k = size; k < 64; ++k) {
    pm *= table.a / static_cast<double>(k) - table.s;
    table.cdf[k] = table.cdf[k - 1] + pm;
  }
}

/// The law next to its mode, by running products.
void fill_ratios(service::_btpe_params& hat) {
  const double w = (hat.n + 1.0) * hat.s;
  double down = 1.0;
  double up = 1.0;
  for (int k = 0; k < 32; ++k) {
    down *= (hat.m - k) / (w - hat.s * (hat.m - k));
    hat.down[k] = down;
    up *= w / (hat.m + (k + 1)) - hat.s;
    hat.up[k] = up;
  }
}

}  // namespace

bool is_binomial_flipped(double p) {
  return p >= 0.5;
}

double binomial_mean(std::int32_t ntrial, double p) {
  return is_binomial_flipped(p) ? ntrial * (1 - p) : ntrial * p;
}

service::_bcdf_params bcdf_record(std::int32_t ntrial, double p) {
  const bool flip = is_binomial_flipped(p);
  const double r = flip ? 1 - p : p;
  const double q = flip ? p : 1 - p;
  service::_bcdf_params table{};
  table.n = ntrial;
  table.p = p;
  table.s = r / q;
  table.a = (table.n + 1) * table.s;
  const std::size_t size = static_cast<std::size_t>(r * table.n) + behind_mean;
  const double last = sum_up(table, size, std::pow(q, table.n));
  continue_sums(table, size, last);
  return table;
}

// Kept: fm, s and ll have p where the paper has the smaller of p and 1 - p, while the mean and q
// are those of the smaller one; results depend on it. Up to p = 1/2 there is no difference. Above,
// s is 1, so that what is accepted outside the triangle is weighed by another law.
service::_btpe_params btpe_record(std::int32_t ntrial, double p) {
  const double x = binomial_mean(ntrial, p);
  const double q = is_binomial_flipped(p) ? p : 1 - p;
  service::_btpe_params hat{};
  hat.n = ntrial;
  hat.p = p;
  hat.npq = x * q;
  hat.fm = p + x;
  hat.m = std::trunc(hat.fm);
  hat.s = p / q;
  hat.c = 20.5 / (15.3 + hat.m) + 0.134;
  hat.p1 = std::trunc(2.195 * std::sqrt(hat.npq) + -4.6 * q) + 0.5;
  hat.xm = hat.m + 0.5;
  hat.xl = hat.xm - hat.p1;
  hat.xr = hat.xm + hat.p1;
  const double al = (hat.fm - hat.xl) / (hat.fm - p * hat.xl);
  hat.ll = (0.5 * al + 1.0) * al;
  const double ar = (hat.xr - hat.fm) / (q * hat.xr);
  hat.lr = (0.5 * ar + 1.0) * ar;
  hat.inv_ll = 1.0 / hat.ll;
  hat.inv_lr = 1.0 / hat.lr;
  hat.inv_c = 1.0 / hat.c;
  hat.inv_p1 = 1.0 / hat.p1;
  hat.inv_npq = 1.0 / hat.npq;
  hat.p2 = (hat.c + 1.0 + hat.c) * hat.p1;
  hat.p3 = hat.c * hat.inv_ll + hat.p2;
  hat.p4 = hat.c * hat.inv_lr + hat.p3;
  fill_ratios(hat);
  return hat;
}

TARN_ACCEPTANCE_REJECTION(template, std::int32_t, functors::binomial_post)

}  // namespace kestrel::tarn::rng::detail::gpu
