// SPDX-License-Identifier: Apache-2.0
// The set-up of hypergeometric on the host: the canonical form, the table of a law whose mode is
// small, and the hat of the others. The order of each expression is part of the results.
#include "distributions/hypergeometric_gpu_dispatch.hpp"

#include <cmath>

namespace kestrel::tarn::rng::detail::gpu {

namespace {

/// The counts of a law as doubles.
struct real_counts {
  explicit real_counts(const canonical_hypergeometric& law)
      : n1(law.n1), n2(law.n2), k(law.k), n2_k(n2 - k), lot(law.lot), mode(law.mode) {}

  double log_factorials(double y) const { return gpu::log_factorials(y, n1, k, n2_k, lot); }

  double n1;
  double n2;
  double k;
  double n2_k;
  double lot;
  double mode;
};

/// Probability of the least value.
double first_probability(const canonical_hypergeometric& law) {
  const real_counts x(law);
  const double lot = x.n1 + x.n2;
  if (law.low != 0) {
    return std::exp(log_factorial(x.n1) + log_factorial(x.k) - log_factorial(x.k - x.n2) -
                    log_factorial(lot));
  }
  return std::exp(log_factorial(x.n2) + log_factorial(lot - x.k) - log_factorial(x.n2 - x.k) -
                  log_factorial(lot));
}

/// Probabilities of the values from `low` on, up to one behind the mode that no longer counts.
std::vector<double> probabilities(const canonical_hypergeometric& law) {
  const real_counts x(law);
  const auto values = static_cast<std::size_t>(law.high - law.low) + 1;
  const auto to_mode = static_cast<std::size_t>(law.mode - law.low);
  std::vector<double> pmf{first_probability(law)};
  double f = law.low;
  while (pmf.size() < values) {
    const double t = (x.k - f) * (x.n1 - f) / ((x.n2_k + f + 1.0) * (f + 1.0)) * pmf.back();
    f += 1.0;
    if (pmf.size() >= to_mode && 2.220446049250313e-16 > t) {
      break;
    }
    pmf.push_back(t);
  }
  return pmf;
}

/// The law next to its mode, by running products.
void fill_ratios(service::_h2pe_params& hat, const real_counts& x) {
  double down = 1.0;
  double up = 1.0;
  for (int j = 0; j < 64; ++j) {
    const double below = x.mode - j;
    down *= (x.n2_k + below) * below / ((x.k - below + 1.0) * (x.n1 - below + 1.0));
    hat.down[j] = down;
    const double above = x.mode + j;
    up *= (x.k - above) * (x.n1 - above) / ((x.n2_k + above + 1.0) * (above + 1.0));
    hat.up[j] = up;
  }
}

}  // namespace

canonical_hypergeometric canonical_form(std::int32_t lot, std::int32_t sample,
                                        std::int32_t marked) {
  canonical_hypergeometric law{};
  law.lot = lot;
  law.marked = marked;
  law.sample = sample;
  law.n1 = std::min(marked, lot - marked);
  law.n2 = std::max(marked, lot - marked);
  law.k = is_sample_smaller(lot, sample) ? sample : lot - sample;
  law.low = std::max(law.k - law.n2, 0);
  law.high = std::min(law.n1, law.k);
  law.mode = static_cast<std::int32_t>((law.n1 + 1.0) * (law.k + 1.0) / (lot + 2.0));
  return law;
}

std::int32_t hypergeometric_constant(const canonical_hypergeometric& law) {
  if (is_sample_smaller(law.lot, law.sample)) {
    return law.sample - law.low;
  }
  return law.marked > law.lot - law.marked ? law.sample - law.n1 + law.low : law.marked - law.low;
}

// Up to the mode from the first probability on, behind it from 1 down: so each sum has the accuracy
// of the nearer end. The mode's probability is far above the least that counts, so it is there.
std::vector<double> hypergeometric_table(const canonical_hypergeometric& law) {
  const std::vector<double> pmf = probabilities(law);
  const auto to_mode = static_cast<std::size_t>(law.mode - law.low);
  std::vector<double> cdf(pmf.size());
  cdf[0] = pmf[0];
  for (std::size_t i = 1; i <= to_mode; ++i) {
    cdf[i] = cdf[i - 1] + pmf[i];
  }
  cdf.back() = 1.0;
  for (std::size_t i = cdf.size() - 1; i-- > to_mode + 1;) {
    cdf[i] = cdf[i + 1] - pmf[i + 1];
  }
  return cdf;
}

service::_h2pe_params h2pe_record(const canonical_hypergeometric& law) {
  const real_counts x(law);
  const double variance = (x.lot - x.k) * x.k * x.n1 * x.n2 / (-1.0 + x.lot);
  const double d = std::floor(std::sqrt(variance) / x.lot * 1.5) + 0.5;
  service::_h2pe_params hat{};
  hat.lot = law.lot;
  hat.marked = law.marked;
  hat.sample = law.sample;
  hat.xl = x.mode - d + 0.5;
  hat.xr = d + x.mode + 0.5;
  hat.c1 = x.mode + 0.5;
  hat.c2 = x.n1 - x.mode + 0.5;
  hat.c3 = x.k - x.mode + 0.5;
  hat.c4 = hat.c1 + x.n2_k;
  hat.ll = -std::log((x.n2_k + hat.xl) * hat.xl / (x.n1 - hat.xl + 1.0) / (x.k - hat.xl + 1.0));
  hat.lr = -std::log((x.k - hat.xr + 1.0) * (x.n1 - hat.xr + 1.0) / hat.xr / (hat.xr + x.n2_k));
  hat.inv_ll = 1.0 / hat.ll;
  hat.inv_lr = 1.0 / hat.lr;
  hat.a = x.log_factorials(x.mode);
  const double kl = std::exp(hat.a - x.log_factorials(std::trunc(hat.xl)));
  const double kr = std::exp(hat.a - x.log_factorials(std::trunc(hat.xr) - 1));
  hat.p1 = 2 * d;
  hat.p2 = kl * hat.inv_ll + hat.p1;
  hat.p3 = kr * hat.inv_lr + hat.p2;
  fill_ratios(hat, x);
  return hat;
}

functors::hypergeometric<hypergeometric_algorithm::h2pe> h2pe_functor(
    const canonical_hypergeometric& law, const service::_h2pe_params* params) {
  const real_counts x(law);
  return {0.0,
          1.0,
          x.mode,
          x.n1,
          x.n2,
          x.k,
          x.lot,
          static_cast<double>(law.low),
          static_cast<double>(law.high),
          law.mode,
          law.n1,
          law.k,
          law.n2 - law.k,
          law.lot,
          law.marked,
          law.sample,
          params};
}

TARN_ACCEPTANCE_REJECTION(template, std::int32_t, functors::hypergeometric_post)

}  // namespace kestrel::tarn::rng::detail::gpu
