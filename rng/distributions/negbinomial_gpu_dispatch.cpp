// SPDX-License-Identifier: Apache-2.0
// The set-up of negative_binomial on the host: the table of a law whose mode is small, and the hat
// of the others. The order of each expression is part of the results.
#include "distributions/negbinomial_gpu_dispatch.hpp"

#include <cmath>

#include <kestrel/tarn/exceptions.hpp>

namespace kestrel::tarn::rng::detail::gpu {

namespace {

using service::_nbar_params;

/// One side of the hat. The law is concave between the zeros of its second difference, about kl and
/// kr, and convex outside. From there a slope goes down to the place where the tangent in the zero
/// ends, and then an exponential tail.
struct hat_side {
  double k;        // the zero, at a count
  double x;        // end of the slope
  double at_k;     // the law at k
  double at_x;     // height of the slope at its end
  double ratio;    // of neighbouring values of the tail, towards greater counts
  double in_tail;  // height of the tail where it begins
};

/// The law next to its mode, by running products.
void fill_ratios(_nbar_params& hat, double a1, double q) {
  double down = 1.0;
  double up = 1.0;
  for (int j = 0; j < 64; ++j) {
    const double below = hat.m - j;
    down = down * below / ((a1 + below) * q);
    hat.down[j] = down;
    const double above = hat.m + 1 + j;
    up = up * ((a1 + above) * q / above);
    hat.up[j] = up;
  }
}

/// The law at z, `distance` counts from the mode; `near` is the law on that side of it. The mode
/// itself, distance 0, is met by numbers so large that counts fall together.
double law_at(const _nbar_params& hat, const double (&near)[64], double distance, double z,
              double a1, double q) {
  if (distance <= 64) {
    return distance >= 1 ? near[static_cast<int>(distance) - 1] : 1.0;
  }
  return std::exp(nbar_log_law(z, a1, q) - hat.tm);
}

hat_side right_side(const _nbar_params& hat, double kr, double a1, double q) {
  const double x = (kr + 1.0) / (kr + 1.0 - (kr + hat.a) * q) + kr;
  const double i = std::trunc(x);
  const double at_k = law_at(hat, hat.up, std::trunc(kr - hat.m), kr, a1, q);
  const double at_i = law_at(hat, hat.up, std::trunc(i - hat.m), i, a1, q);
  const double ratio = (hat.a + i) * q / (i + 1.0);
  return {kr, x, at_k, i * at_i / ((a1 + i) * q), ratio, std::pow(ratio, x - i + -1.0) * at_i};
}

hat_side left_side(const _nbar_params& hat, double kl, double a1, double q) {
  const double c = q * (a1 + kl);
  const double xl0 = 1.0 + kl;
  const double x = c / (kl - c) + xl0;
  const double i = std::trunc(x);
  const double at_k = law_at(hat, hat.down, std::trunc(hat.m - xl0) + 1, kl, a1, q);
  const double at_i = law_at(hat, hat.down, std::trunc(hat.m - i), i, a1, q);
  const double ratio = (a1 + i) * q / i;
  return {kl, x, at_k, (i + hat.a) * at_i * q / (i + 1.0), ratio, std::pow(ratio, x - i) * at_i};
}

void fill_centre(_nbar_params& hat, const hat_side& right, const hat_side& left) {
  const double xl0 = 1.0 + left.k;
  const double centre = right.k - xl0;
  const double right_slope = (0.5 * right.at_k + right.at_x) * (right.x - right.k);
  const double left_slope = (0.5 * left.at_k + left.at_x) * (xl0 - left.x);
  const double right_tail = -right.in_tail / std::log(right.ratio);
  const double left_tail = left.in_tail / std::log(left.ratio);
  const double total = centre + right_slope + left_slope + right_tail + left_tail;
  hat.P[0] = centre / total;
  hat.P[1] = (centre + right_slope) / total;
  hat.P[2] = (centre + right_slope + left_slope) / total;
  hat.P[3] = (centre + right_slope + left_slope + right_tail) / total;
  hat.P[4] = total / total;
  hat.r0s = centre / hat.P[0];
  hat.r0o = xl0;
}

void fill_right(_nbar_params& hat, const hat_side& right) {
  const double w = right.at_x / right.at_k;
  hat.sr = (1 - right.at_k) / (hat.m - right.k);
  hat.or_ = 1 - hat.sr * hat.m;
  hat.b1s = (w + 1 + w) / (hat.P[1] - hat.P[0]);
  hat.b1o = w * w - hat.b1s * hat.P[0];
  hat.b1d = right.x - right.k;
  hat.b1c = hat.b1d * w + right.x;
  hat.b1f = right.at_k;
  hat.b1g = right.at_k / (right.k - right.x);
  hat.b1h = -right.x * hat.b1g;
  hat.e1s = 1 / std::log(right.ratio);
  hat.e1o = right.x;
  hat.e1w = right.in_tail / (hat.P[3] - hat.P[2]);
}

void fill_left(_nbar_params& hat, const hat_side& left) {
  const double xl0 = 1.0 + left.k;
  const double w = left.at_x / left.at_k;
  hat.sl = (1 - left.at_k) / (hat.m - left.k);
  hat.ol = 1 - (hat.m + 1) * hat.sl;
  hat.b2s = (w + 1 + w) / (hat.P[2] - hat.P[1]);
  hat.b2o = -hat.b2s * hat.P[1] + w * w;
  hat.b2d = left.x - xl0;
  hat.b2c = left.x + hat.b2d * w;
  hat.b2f = left.at_k;
  hat.b2g = left.at_k / (xl0 - left.x);
  hat.b2h = -left.x * hat.b2g;
  hat.e2s = 1 / std::log(left.ratio);
  hat.e2o = left.x;
  hat.e2w = left.in_tail / (hat.P[4] - hat.P[3]);
}

/// Whether all pieces have an area; false as well where one is not a number.
bool has_areas(const _nbar_params& hat) {
  const double* sums = hat.P;
  return 0 < sums[0] && sums[0] < sums[1] && sums[1] < sums[2] && sums[2] < sums[3] &&
         sums[3] < sums[4];
}

}  // namespace

double negative_binomial_mode(double a, double p) {
  return (a - 1) * (1 - p) / p;
}

service::_nbar_params nbar_record(double a, double p) {
  const double a1 = a - 1;
  const double q = 1 - p;
  const double mu = negative_binomial_mode(a, p);
  service::_nbar_params hat{};
  hat.a = a;
  hat.p = p;
  hat.m = std::trunc(mu);
  hat.tm = nbar_log_law(hat.m, a1, q);
  fill_ratios(hat, a1, q);
  const double sd = std::sqrt(mu / p + 0.25);
  const hat_side right = right_side(hat, std::ceil(sd + (mu + -0.5)), a1, q);
  const hat_side left = left_side(hat, std::trunc(mu + -0.5 - sd), a1, q);
  fill_centre(hat, right, left);
  fill_right(hat, right);
  fill_left(hat, left);
  if (!has_areas(hat)) {
    throw invalid_argument("rng", "negative_binomial", "these parameters are not supported on GPU");
  }
  return hat;
}

std::int32_t negative_binomial_table_size(double a, double p) {
  const double mode = std::trunc(negative_binomial_mode(a, p));
  return (mode < 1 ? 0 : static_cast<std::int32_t>(mode)) + 128;
}

void fill_negative_binomial_table(double a, double p, std::int32_t size, double* cdf) {
  const double q = 1 - p;
  double probability = std::pow(p, a);
  double sum = 0;
  for (std::int32_t k = 0; k < size; ++k) {
    sum += probability;
    cdf[k] = sum;
    probability = (a + k) * q * probability / (static_cast<double>(k) + 1);
  }
}

TARN_ACCEPTANCE_REJECTION(template, std::int32_t, functors::negative_binomial_post)

}  // namespace kestrel::tarn::rng::detail::gpu
