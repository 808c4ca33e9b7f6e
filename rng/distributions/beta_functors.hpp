// SPDX-License-Identifier: Apache-2.0
// Kernel functors of beta with the shapes p and q. Candidates of two uniforms, by five methods:
//   johnk         both shapes small: M. D. Johnk, Erzeugung von betaverteilten und gammaverteilten
//                 Zufallszahlen, Metrika 8, 1964.
//   both_below    both below 1 otherwise,
//   first_below   p < 1 < q,
//   second_below  q < 1 < p, the mirror image: A. C. Atkinson, A family of switching algorithms for
//                 the computer generation of beta random variables, Biometrika 66, 1979.
//   cheng         both above 1, algorithm BB: R. C. H. Cheng, Generating beta variates with
//                 nonintegral shape parameters, Communications of the ACM 21, 1978.
// Where a shape is 1 the cdf has an inverse.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "distributions/formulas.hpp"
#include "distributions/kernel_functor.hpp"

namespace kestrel::tarn::rng::detail::gpu {

namespace beta_algorithm {
struct acc_rej {};
struct pq {};
}  // namespace beta_algorithm

namespace functors {

enum class beta_way : std::int32_t {
  johnk = 0,
  both_below = 1,
  first_below = 2,
  second_below = 3,
  cheng = 4
};

enum class beta_power : std::int32_t { first_is_one = 0, second_is_one = 1, no_number = 2 };

/// -ln(4) as float has it, also in double. Kept: results depend on it.
template <typename T>
inline constexpr T minus_log_of_4 = static_cast<T>(-0x1.62E43p0);
static_assert(minus_log_of_4<float> == -1.38629436f);
static_assert(minus_log_of_4<double> == -1.3862943649291992);

/// y in [a, a + b], however it was rounded.
template <typename T>
SYCL_EXTERNAL T kept_inside(T y, T a, T b) {
  const T raised = y < a ? a : y;
  const T top = a + b;
  return raised > top ? top : raised;
}

template <typename T, typename Algorithm>
struct beta;

/// The switching methods cover [0, t] by a power function and [t, 1] by another; `split` is the
/// probability of the first, and in the mirror image p and q change places. Members that a method
/// does not use are 0.
template <typename T>
struct beta<T, beta_algorithm::acc_rej> {
  using source = T;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 2;
  static constexpr int pair_results = 1;
  static constexpr T rejected = -1;

  T r0;
  T r1;
  T p;
  T q;
  T split;
  T t;
  T w1;  // the first piece: w1 u^inv[0]
  T w2;  // the second: 1 - w2 (1 - u)^inv[1]
  T e1;
  T e2;
  T r1t;  // 1 / (1 - t)
  T rt;   // 1 / t
  T inv[2];
  T s;  // p + q
  T bb;
  T cc;
  beta_way method;

  real_range<T> range() const { return {r0, r1}; }

  SYCL_EXTERNAL sycl::vec<T, results> operator()(const sycl::vec<T, 4>& u) const {
    return pairs_of<T>(*this, u);
  }

  SYCL_EXTERNAL void pair(T u0, T u1, T* out) const {
    if (method == beta_way::johnk) {
      out[0] = by_powers(u0, u1);
    } else if (method == beta_way::cheng) {
      out[0] = by_odds(u0, u1);
    } else {
      out[0] = by_switch(u0, guarded_log(u1));
    }
  }

 private:
  /// Of two powers that both vanish nothing can be told.
  SYCL_EXTERNAL T by_powers(T u0, T u1) const {
    const T x = sycl::exp(guarded_log(u0) / p);
    const T y = sycl::exp(guarded_log(u1) / q);
    const T d = x + y;
    return d > 0 && d <= 1 ? x / d : rejected;
  }

  /// `lw`: logarithm of the uniform that judges.
  SYCL_EXTERNAL T by_switch(T u, T lw) const {
    const bool second = u > split;
    const T x = second ? sycl::mad(-w2, sycl::pow(1 - u, inv[1]), T(1)) : w1 * sycl::pow(u, inv[0]);
    const T test = sycl::mad(second ? e2 : e1, guarded_log(relative(x, second)), lw);
    if (!(test <= 0)) {
      return rejected;
    }
    return method == beta_way::second_below ? 1 - x : x;
  }

  /// The factor of the density that its piece leaves out, to the value at the piece's end.
  SYCL_EXTERNAL T relative(T x, bool second) const {
    if (method == beta_way::both_below) {
      return second ? x * rt : (1 - x) * r1t;
    }
    return second ? x / t : 1 - x;
  }

  SYCL_EXTERNAL T by_odds(T u0, T u1) const {
    const T v = bb * guarded_log(u0 / (1 - u0));
    const T w = p * sycl::exp(v);
    const T rw = 1 / (q + w);
    const T g = guarded_log(s * rw);
    const T z = guarded_log(u0 * u0 * u1);
    const T h = sycl::mad(s, g, cc * v) + minus_log_of_4<T>;
    return h >= z ? w * rw : rejected;
  }
};

/// A standard beta number at its place, which `accurate` keeps rounding from bringing out of
/// [a, a + b].
template <typename T>
struct beta_post {
  T a;
  T b;
  std::uint8_t accurate;

  SYCL_EXTERNAL T operator()(T v) const {
    const T y = sycl::mad(v, b, a);
    return accurate != 0 ? kept_inside(y, a, b) : y;
  }
};

/// One uniform, one result. Of a shape that is no number the results are the uniforms, which come
/// from [a, a + b) then.
template <typename T>
struct beta<T, beta_algorithm::pq> {
  using source = T;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  T r0;
  T r1;
  T shape;
  T a;
  T b;
  beta_power method;
  std::uint8_t accurate;

  real_range<T> range() const { return {r0, r1}; }

  SYCL_EXTERNAL sycl::vec<T, results> operator()(const sycl::vec<T, 4>& u) const {
    return each_of<T>(*this, u);
  }

  SYCL_EXTERNAL T one(T u) const {
    const T y = placed(u);
    return accurate != 0 ? kept_inside(y, a, b) : y;
  }

 private:
  SYCL_EXTERNAL T placed(T u) const {
    if (method == beta_power::no_number) {
      return u;
    }
    const T power = sycl::pow(u, 1 / shape);
    return b * (method == beta_power::first_is_one ? 1 - power : power) + a;
  }
};

}  // namespace functors
}  // namespace kestrel::tarn::rng::detail::gpu
