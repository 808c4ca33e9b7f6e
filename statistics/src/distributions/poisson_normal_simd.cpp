// SPDX-License-Identifier: Apache-2.0
// Poisson variates by way of normal deviates, and small rates of their own for each value.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/poisson_normal_simd.cpp"
#include <algorithm>

#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/guide_table.hpp"
#include "distributions/poisson.hpp"
#include "simd/erfinv-inl.hpp"
#include "simd/map-inl.hpp"
#include "simd/target.hpp"
#include "simd/vector_math-inl.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

using reals = hn::ScalableTag<double>;
using integers = hn::Rebind<std::int32_t, reals>;
using real_vector = hn::Vec<reals>;

template <int Terms>
HWY_INLINE real_vector polynomial(const double (&coefficient)[Terms], real_vector x) {
  const reals d;
  real_vector sum = hn::Set(d, coefficient[Terms - 1]);
  for (int i = Terms - 2; i >= 0; --i)
    sum = hn::Add(hn::Mul(sum, x), hn::Set(d, coefficient[i]));
  return sum;
}

// floor(x), at least 0, for the lower end of a tail may lie below. The conversion drops the
// fraction and gives the greatest integer for numbers beyond it.
HWY_INLINE hn::Vec<integers> to_count(real_vector x) {
  const auto zero = hn::Zero(reals());
  return hn::DemoteTo(integers(), hn::IfThenElse(hn::Gt(x, zero), x, zero));
}

void poisson_by_normal(const double* u, std::size_t n, const poisson_expansion& x,
                       std::int32_t* out) {
  map_all(integers(), u, n, false, out,
          [&](auto v) HWY_ATTR { return to_count(polynomial(x.coefficient, vector_erfinv(v))); });
}

// ---- A rate for each value --------------------------------------------------------------------

HWY_INLINE real_vector expansion(real_vector u, real_vector lambda) {
  const reals d;
  const auto z = hn::Mul(vector_erfinv(u), hn::Set(d, 1.4142135623730951));
  const auto root = hn::Sqrt(lambda);
  const auto s = hn::Div(z, root);
  const auto correction = hn::Add(polynomial(poisson_expansion::c0, s),
                                  hn::Div(polynomial(poisson_expansion::c1, s), lambda));
  const auto curve = hn::Mul(hn::Mul(z, z), polynomial(poisson_expansion::g, s));
  return hn::Add(lambda, hn::Add(hn::Mul(root, z), hn::Add(curve, correction)));
}

struct reciprocal_table {
  double of[most_small_values];
};
constexpr reciprocal_table make_reciprocals() {
  reciprocal_table table{};
  for (int k = 1; k < most_small_values; ++k)
    table.of[k] = 1.0 / k;
  return table;
}
constexpr reciprocal_table reciprocals = make_reciprocals();

// The number of partial sums of the probabilities that u reaches, for rates below table_rates.
HWY_INLINE real_vector sum_up(real_vector u, real_vector lambda) {
  const reals d;
  // Behind the mode no term below this one changes a sum.
  const auto negligible = hn::Set(d, 0x1p-60);
  const auto one = hn::Set(d, 1.0);
  auto term = vector_exp(hn::Neg(lambda));
  auto sum = term;
  auto count = hn::Zero(d);
  for (int k = 1; k < most_small_values; ++k) {
    const auto above = hn::And(hn::Ge(u, sum), hn::Gt(term, negligible));
    if (hn::AllFalse(d, above))
      break;
    count = hn::Add(count, hn::IfThenElseZero(above, one));
    term = hn::Mul(term, hn::Mul(lambda, hn::Set(d, reciprocals.of[k])));
    sum = hn::Add(sum, term);
  }
  return count;
}

HWY_INLINE hn::Vec<integers> count_of(real_vector u, real_vector lambda) {
  const reals d;
  const auto bound = hn::Set(d, table_rates);
  const auto greatest = hn::Set(d, greatest_rate);
  const auto small = hn::Lt(lambda, bound);
  auto x = hn::Zero(d);
  if (!hn::AllTrue(d, small)) {
    const auto capped = hn::IfThenElse(hn::Lt(lambda, greatest), lambda, greatest);
    x = expansion(u, hn::IfThenElse(small, bound, capped));
  }
  if (!hn::AllFalse(d, small)) {
    const auto half = hn::Set(d, 0.5);
    const auto probability = hn::Add(hn::Mul(u, half), half);
    const auto rate = hn::IfThenElse(small, lambda, hn::Set(d, 1.0));
    // Lanes of great rates are done at once.
    x = hn::IfThenElse(small, sum_up(hn::IfThenElse(small, probability, hn::Zero(d)), rate), x);
  }
  return to_count(x);
}

void poisson_v_by_normal(const double* HWY_RESTRICT u, std::size_t n,
                         const double* HWY_RESTRICT lambda, std::int32_t* HWY_RESTRICT out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const reals d;
  const integers di;
  const std::size_t lanes = hn::Lanes(d);
  std::size_t i = 0;
  for (; i + lanes <= n; i += lanes)
    hn::StoreU(count_of(hn::LoadU(d, u + i), hn::LoadU(d, lambda + i)), di, out + i);
  if (const std::size_t rest = n - i; rest != 0) {
    constexpr std::size_t most = HWY_MAX_BYTES / sizeof(double);
    HWY_ALIGN double numbers[most] = {}, rates[most];
    HWY_ALIGN std::int32_t counts[most];
    std::fill_n(rates, most, 1.0);
    std::copy_n(u + i, rest, numbers);
    std::copy_n(lambda + i, rest, rates);
    hn::Store(count_of(hn::Load(d, numbers), hn::Load(d, rates)), di, counts);
    std::copy_n(counts, rest, out + i);
  }
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(poisson_by_normal);
HWY_EXPORT(poisson_v_by_normal);

void poisson_by_normal(const double* u, std::size_t n, const poisson_expansion& x,
                       std::int32_t* out) {
  TARN_SIMD_CALL(poisson_by_normal)(u, n, x, out);
}

void poisson_v_by_normal(const double* u, std::size_t n, const double* lambda, std::int32_t* out) {
  TARN_SIMD_CALL(poisson_v_by_normal)(u, n, lambda, out);
}

}  // namespace tarn::statistics
#endif
