// SPDX-License-Identifier: Apache-2.0
// The set-up of beta's methods, in the result's type, and its passes.
#include "distributions/beta_gpu_dispatch.hpp"

#include <cmath>
#include <limits>

#include <kestrel/tarn/exceptions.hpp>

namespace kestrel::tarn::rng::detail::gpu {

namespace {

// What the switching methods share: a first piece up to t0, of probability p0, for the shape
// `lower`, and a second one for the shape `upper`.
template <typename T>
beta_candidates<T> with_pieces(beta_candidates<T> record, T lower, T upper, T t0, T p0) {
  record.split = p0;
  record.t = t0;
  record.w1 = t0 * std::pow(1 / p0, 1 / lower);
  record.w2 = (1 - t0) * std::pow(1 / (1 - p0), 1 / upper);
  record.e1 = 1 - upper;
  record.e2 = 1 - lower;
  record.inv[0] = 1 / lower;
  record.inv[1] = 1 / upper;
  return record;
}

template <typename T>
beta_candidates<T> beta_both_below(beta_candidates<T> record) {
  const T p = record.p, q = record.q;
  const T root = std::sqrt((1 - p) * p);
  const T t0 = root / (std::sqrt(q * (1 - q)) + root);
  const T p0 = q * t0 / ((1 - t0) * p + q * t0);
  record.r1t = 1 / (1 - t0);
  record.rt = 1 / t0;
  return with_pieces(record, p, q, t0, p0);
}

// lower < 1 < upper.
template <typename T>
beta_candidates<T> beta_one_below(beta_candidates<T> record, T lower, T upper) {
  const T t0 = (1 - lower) / ((1 - lower) + upper);
  const T p0 = upper * t0 / (std::pow(1 - t0, upper) * lower + upper * t0);
  return with_pieces(record, lower, upper, t0, p0);
}

template <typename T>
beta_candidates<T> beta_both_above(beta_candidates<T> record) {
  const T p = record.p, q = record.q;
  record.s = p + q;
  record.bb = std::sqrt((-2 + record.s) / ((p + p) * q - record.s));
  record.cc = p + 1 / record.bb;
  return record;
}

// Which of the methods for shapes below 1 accepts more: about the line where they are equal.
template <typename T>
bool is_for_johnk(T p, T q) {
  constexpr T c1 = static_cast<T>(0.8522552176537243);
  constexpr T c2 = static_cast<T>(-0.9562409713408151);
  static_assert(static_cast<float>(c1) == 0.8522552f && static_cast<float>(c2) == -0.95624095f);
  return c1 * p * p + q + c2 <= 0;
}

template <typename T>
functors::beta_way beta_way_of(T p, T q) {
  using functors::beta_way;
  if (p < 1 && q < 1) {
    return is_for_johnk(p, q) ? beta_way::johnk : beta_way::both_below;
  }
  if (p > 1 && q > 1) {
    return beta_way::cheng;
  }
  return p < 1 ? beta_way::first_below : beta_way::second_below;
}

/// Whether more than about one candidate of ten thousand is accepted.
template <typename T>
bool is_drawable(const beta_candidates<T>& hat) {
  using functors::beta_way;
  switch (hat.method) {
    case beta_way::johnk:
      // ln(u) / p is above the least logarithm in that part of all u.
      return -log_of_zero<T> * (hat.p + hat.q) > static_cast<T>(1e-4);
    case beta_way::both_below:
      return std::isfinite(hat.w1);
    case beta_way::first_below:
    case beta_way::second_below:
      return hat.t > 0;
    case beta_way::cheng:
      // From there on the logarithms that are compared have rounding errors above 1.
      return hat.bb > 0 && hat.s <= 2 / std::numeric_limits<T>::epsilon();
  }
  return false;
}

}  // namespace

template <typename T>
void check_beta_candidates(const beta_candidates<T>& candidates) {
  if (!is_drawable(candidates)) {
    throw invalid_argument("rng", "beta", "these parameters are not supported on GPU");
  }
}

template <typename T>
beta_candidates<T> beta_candidates_of(T p, T q) {
  using functors::beta_way;
  beta_candidates<T> record{};
  record.r1 = 1;
  record.p = p;
  record.q = q;
  record.method = beta_way_of(p, q);
  switch (record.method) {
    case beta_way::both_below:
      return beta_both_below(record);
    case beta_way::first_below:
      return beta_one_below(record, p, q);
    case beta_way::second_below:
      return beta_one_below(record, q, p);
    case beta_way::cheng:
      return beta_both_above(record);
    case beta_way::johnk:
      break;
  }
  return record;
}

template <typename T>
functors::beta<T, beta_algorithm::pq> beta_power_of(T p, T q, T a, T b, bool accurate) {
  using functors::beta_power;
  const auto byte = static_cast<std::uint8_t>(accurate);
  if (p == 1) {
    return {0, 1, q, a, b, beta_power::first_is_one, byte};
  }
  if (q == 1) {
    return {0, 1, p, a, b, beta_power::second_is_one, byte};
  }
  return {a, a + b, p, a, b, beta_power::no_number, byte};
}

template void check_beta_candidates(const beta_candidates<float>&);
template void check_beta_candidates(const beta_candidates<double>&);
template beta_candidates<float> beta_candidates_of(float, float);
template beta_candidates<double> beta_candidates_of(double, double);
template functors::beta<float, beta_algorithm::pq> beta_power_of(float, float, float, float, bool);
template functors::beta<double, beta_algorithm::pq> beta_power_of(double, double, double, double,
                                                                  bool);

TARN_ACCEPTANCE_REJECTION(template, float, functors::beta_post<float>)
TARN_ACCEPTANCE_REJECTION(template, double, functors::beta_post<double>)

}  // namespace kestrel::tarn::rng::detail::gpu
