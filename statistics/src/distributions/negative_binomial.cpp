// SPDX-License-Identifier: Apache-2.0
// Set-ups of negative binomial variates, and the candidates for shapes below 1.
#include "distributions/negative_binomial.hpp"

#include <algorithm>
#include <cmath>
#include <limits>

namespace tarn::statistics {

negative_binomial_law::negative_binomial_law(double shape, double probability)
    : a(shape), p(probability), q(1 - probability), v((shape - 1) * q / probability) {}

bool negative_binomial_law::saturated() const {
  constexpr double greatest = std::numeric_limits<std::int32_t>::max();
  // From a = 1 on P(X <= x) is at most (x + 1) p, the one of a = 1. And P(X <= mean - t sd) is at
  // most exp(-t^2 / 2), since no cumulant is negative; here t = 10.
  const double root = std::sqrt(a * q);
  return (a >= 1 && p <= 0x1p-100) || root * ((root - 10) / p) >= greatest;
}

tabulated_values invert_negative_binomial(const negative_binomial_law& law, std::size_t uses) {
  const double a = law.a, q = law.q;
  const auto mode = static_cast<std::int32_t>(std::max(law.v, 0.0));
  return {tabulate(
              mode, [=](double k) { return (a + k) * q / (k + 1); },
              [=](double k) { return k == 0 ? 0 : k / ((a - 1 + k) * q); }),
          uses, 0, false};
}

nbar::nbar(const negative_binomial_law& law, std::size_t uses) : result{0, 1} {
  const double a1 = law.a - 1, p = law.p, q = law.q;
  const double mode = std::floor(law.v);
  ratio.reference = std::max(mode, 1.0);
  // ln((a1 + k) q / k), where (a1 + k) q - k = a1 q - p k is the difference of large numbers next
  // to each other; its error counts as often as there are steps from the mode.
  const auto excess = static_cast<double>(a1 * (1 - static_cast<long double>(p)) -
                                          static_cast<long double>(p) * ratio.reference);
  ratio.slope = std::log1p(excess / ratio.reference);
  ratio.shift = mode == 0 ? std::log1p(a1 * q - p) : 0;
  if (a1 > 0)
    ratio.add_quotient(a1);
  near.center = mode;
  if (uses >= near_ratios::worth)
    near.keep(ratio);

  const double deviation = std::sqrt(law.v / p + 0.25);
  right.knee = std::ceil(law.v - 0.5 + deviation);
  right.ratio = ratio_of(ratio, right.knee);
  right.chord = right.knee > mode ? (1 - right.ratio) / (right.knee - mode) : 0;
  right.width = (right.knee + 1) / (p * (right.knee + 1) - a1 * q);
  right.foot = right.knee + right.width;
  right.tangent = right.ratio / right.width;
  const double outer = std::floor(right.foot);
  right.excess = ratio_of(ratio, outer - 1) / right.ratio;
  right.decay = std::log1p(a1 * q / (outer + 1) - p);
  const double right_height =
      ratio_of(ratio, outer) * std::exp((right.foot - outer - 1) * right.decay);

  left = {};
  const double lower = std::floor(law.v - 0.5 - deviation);
  const bool has_left = lower >= 1;
  left.knee = has_left ? lower : 0;
  left.ratio = ratio_of(ratio, left.knee);
  left.chord = mode > left.knee ? (1 - left.ratio) / (mode - left.knee) : 0;
  left.decay = -1;
  double left_height = 0;
  if (has_left) {
    const double tangent_width = (a1 + left.knee) * q / (a1 * q - p * left.knee);
    left.tangent = left.ratio / tangent_width;
    left.foot = left.knee + 1 - tangent_width;
    const double inner = std::floor(left.foot);
    left.excess = ratio_of(ratio, std::max(inner + 1, 0.0)) / left.ratio;
    if (inner >= 1) {
      left.decay = -std::log1p((a1 * q - p * inner) / inner);
      left_height = ratio_of(ratio, inner) * std::exp((inner - left.foot) * left.decay);
    } else {
      // No tail: the trapezoid reaches 0. Flatter than the tangent it stays above it.
      left.foot = std::min(left.foot, 0.0);
    }
    left.width = left.knee + 1 - left.foot;
  }

  begin = has_left ? left.knee + 1 : 0;
  middle = right.knee - begin;
  const auto area = [](const side& s) { return (0.5 + s.excess) * s.ratio * s.width; };
  right.slope_area = area(right);
  left.slope_area = area(left);
  right.slope_end = middle + right.slope_area;
  left.slope_end = right.slope_end + left.slope_area;
  right.tail_end = left.slope_end - right_height / right.decay;
  left.tail_end = total = right.tail_end - left_height / left.decay;
}

power_hat::power_hat(const negative_binomial_law& law) : a(law.a) {
  // Keeps the border and the heights finite. Only chances of results too large depend on it, and
  // the one of 0 where p is below 10^-300.
  rate = std::max(-std::log1p(-law.p), 1e-300);
  border = 1 / rate;
  const double start = a / 2;
  const double log_start = std::log(a) - std::log(2.0);  // `start` itself may underflow
  log_span = std::log(border) - log_start;
  const double scale = a / std::tgamma(1 + a);  // of the law from 1 on, relative to P(0)
  power_area = scale * (std::exp(a * log_start) * std::expm1(a * log_span) / a);
  log_border = (a - 1) * std::log(border) - rate * (border - start);
  total = 1 + power_area + scale * std::exp(log_border) / rate;
}

namespace {

// ln(Gamma(y + a) / y!) for a < 1. From 1000 on by the expansion in y + a / 2 (Tricomi, Erdelyi:
// The asymptotic expansion of a ratio of gamma functions, Pacific J. Math. 1, 1951), whose next
// term is below 10^-13 there.
double log_gamma_ratio(double y, double a) {
  if (y < 1000)
    return std::lgamma(y + a) - std::lgamma(y + 1);
  const double middle = y + a / 2;
  return (a - 1) * std::log(middle) + std::log1p(a * (1 - a) * (a - 2) / 24 / (middle * middle));
}

}  // namespace

std::size_t power_hat::attempt(const double* uniforms, std::size_t count, std::int32_t* out) const {
  constexpr double greatest = std::numeric_limits<std::int32_t>::max();
  std::size_t accepted = 0;
  for (std::size_t i = 0; i < count; ++i) {
    double u = uniforms[2 * i] * total;
    const double v = std::max(uniforms[2 * i + 1], least_uniform);
    if (u <= 1) {
      out[accepted++] = 0;
      continue;
    }
    u -= 1;
    double z, log_w = std::log(v);
    if (u <= power_area) {
      const double part = u / power_area;
      z = a / 2 * std::exp(std::log1p(part * std::expm1(a * log_span)) / a);
      log_w += (a - 1) * std::log(z);
    } else {
      z = border - log_w / rate;
      log_w += log_border + std::log((u - power_area) / (total - 1 - power_area));
    }
    const double y = std::floor(z + (1 - a / 2));
    if (log_w <= log_gamma_ratio(y, a) - rate * y)
      out[accepted++] = static_cast<std::int32_t>(std::min(y, greatest));
  }
  return accepted;
}

}  // namespace tarn::statistics
