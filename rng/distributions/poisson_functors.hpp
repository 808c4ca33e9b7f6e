// SPDX-License-Identifier: Apache-2.0
// Kernel functors of poisson and poisson_v: an inverse of the cdf from one uniform each. The normal
// deviate z of the uniform goes through a polynomial
//
//   x(z) = A + B z (P1 + z (P2 + z (P3 + z P4)))
//
// that approximates the x of Q(x + 1, lambda) = Phi(z), Q being the regularised upper incomplete
// gamma function, in which P(X <= k) = Q(k + 1, lambda); the result is the integer above x. Small
// rates add up their probabilities instead.
#pragma once

#include <cstddef>
#include <cstdint>

#include <sycl/sycl.hpp>

#include "distributions/erfinv.hpp"
#include "distributions/formulas.hpp"
#include "distributions/kernel_functor.hpp"
#include "distributions/normal_icdf.hpp"
#include "distributions/uniform.hpp"

namespace kestrel::tarn::rng::detail::gpu {

#include "distributions/poisson_tables.inc"

/// A table as a constant of a function: see `cubics` in erfinv.hpp.
template <typename Real, std::size_t size>
struct constants {
  Real at[size];
};

template <typename Real, std::size_t size>
SYCL_EXTERNAL constexpr constants<Real, size> constants_of(const Real (&from)[size]) {
  constants<Real, size> to{};
  for (std::size_t i = 0; i < size; ++i) {
    to.at[i] = from[i];
  }
  return to;
}

/// The cubic of four coefficients, constant term first.
template <typename Real>
SYCL_EXTERNAL Real cubic_of(const Real* c, Real x) {
  return cubic(c[3], c[2], c[1], c[0], x);
}

/// The deviate of a uniform of [-1, 1), within 5.42 of 0.
SYCL_EXTERNAL inline float normal_deviate(float u) {
  return erfinv_wrapper(u) * sqrt_of_two<float>;
}

/// The result that belongs to x. One that the type cannot hold is its greatest value.
template <typename T, typename Real>
SYCL_EXTERNAL T count_above(Real x) {
  return floor_to_integer<T>(sycl::fmax(x + 1, Real{0}));
}

/// x(z) for one rate, from a row of a table: the cubics P1 to P4 stand one after the other.
template <typename Real>
struct poisson_inverse {
  Real a;
  Real b;
  Real p[4];

  SYCL_EXTERNAL poisson_inverse(Real centre, Real scale, const Real* cubics_of_p, Real t)
      : a(centre), b(scale) {
    for (int i = 0; i < 4; ++i) {
      p[i] = cubic_of(cubics_of_p + 4 * i, t);
    }
  }

  SYCL_EXTERNAL Real operator()(Real z) const { return sycl::mad(z * cubic_of(p, z), b, a); }
};

/// Rates below 1, and one that is no number: the least j with w <= S_j, where S_j is the sum of
/// lambda^k / k! for k = 0 to j and w is uniform below exp(lambda). It ends at 11, as the sums do
/// at S_10: results depend on it. Beyond lies a probability below 9e-10.
template <typename T>
struct poisson_small_rate {
  static constexpr int sums = 11;
  float total;
  float sum[sums];

  SYCL_EXTERNAL explicit poisson_small_rate(float lambda) {
    const float upper =
        cubic(0.000335164164f, 0.00113698049f, 0.00856593065f, 0.041548796f, lambda);
    const float middle = cubic(upper, 0.166699171f, 0.499995559f, 1.00000024f, lambda);
    total = sycl::fma(middle, lambda, 1.0f);
    float term = 1;
    sum[0] = 1;
    for (int k = 1; k < sums; ++k) {
      term *= lambda / static_cast<float>(k);
      sum[k] = sum[k - 1] + term;
    }
  }

  SYCL_EXTERNAL T one(float u) const {
    const float w = ((u + 1) * total) * 0.5f;
    int j = 0;
    while (j < sums && !(w <= sum[j])) {
      ++j;
    }
    return static_cast<T>(j);
  }
};

/// Rates of [1, 100).
template <typename T>
struct poisson_medium_rate {
  poisson_inverse<float> x;

  SYCL_EXTERNAL explicit poisson_medium_rate(float lambda) : x(inverse_of(lambda)) {}

  SYCL_EXTERNAL T one(float u) const { return count_above<T>(x(normal_deviate(u))); }

 private:
  SYCL_EXTERNAL static poisson_inverse<float> inverse_of(float lambda) {
    static constexpr auto table = constants_of(medium_lambda_table_32);
    constexpr std::uint32_t row = 23;
    const auto bits = sycl::bit_cast<std::uint32_t>(lambda);
    const float t = sycl::bit_cast<float>((bits & 0x7FFFFFu) | 0x3F800000u) - 1;
    const float* c = table.at + row * ((bits >> 23) - 127);
    const float a = sycl::mad(t, sycl::mad(t, c[2], c[1]), c[0]);
    return {a, cubic_of(c + 3, t), c + 7, t};
  }
};

/// Rates of 100 and more: all coefficients are polynomials in 1 / lambda, and x one in the distance
/// d = B z from A.
template <typename T>
struct poisson_large_rate {
  float a;
  float s;
  float c;
  float d;
  float e;

  SYCL_EXTERNAL explicit poisson_large_rate(float lambda) {
    const float i = 1 / lambda;
    a = cubic(0.00164515374f, -0.00128871936f, -0.0194102079f, lambda + -0.666695714f, i);
    const float b = sycl::sqrt(
        cubic(0.00519830827f, -0.00553485425f, -0.000975814823f, lambda + -0.0558066778f, i));
    c = quartic(2.02847028f, -3.85841203f, 2.29098272f, -0.443911403f, 0.00774710532f, i) * i;
    d = quartic(-0.185436428f, 0.35864222f, -0.228162378f, 0.0472242348f, 0.168577015f, i) * i;
    e = quartic(0.0143892644f, -0.029111309f, 0.0232257955f, -0.0126559986f, -0.000114586554f, i) *
        i;
    s = b * sqrt_of_two<float>;
  }

  SYCL_EXTERNAL T one(float u) const {
    const float y = sycl::mad(erfinv_wrapper(u), s, a);
    const float distance = y - a;
    return count_above<T>(cubic(e, d, c, y, distance));
  }

 private:
  SYCL_EXTERNAL static float quartic(float c4, float c3, float c2, float c1, float c0, float x) {
    return sycl::fma(cubic(c4, c3, c2, c1, x), x, c0);
  }
};

/// One rate for all results.
template <typename T>
struct poisson_gaussian_icdf_based {
  using source = float;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  float lambda;
  float r0 = -1;
  float r1 = 1;

  real_range<float> range() const { return {r0, r1}; }

  SYCL_EXTERNAL sycl::vec<T, results> operator()(const sycl::vec<float, 4>& u) const {
    if (lambda >= 100) {
      return each_of<T>(poisson_large_rate<T>(lambda), u);
    }
    if (lambda >= 1) {
      return each_of<T>(poisson_medium_rate<T>(lambda), u);
    }
    return each_of<T>(poisson_small_rate<T>(lambda), u);
  }

  SYCL_EXTERNAL T one(float u) const {
    if (lambda >= 100) {
      return poisson_large_rate<T>(lambda).one(u);
    }
    if (lambda >= 1) {
      return poisson_medium_rate<T>(lambda).one(u);
    }
    return poisson_small_rate<T>(lambda).one(u);
  }
};

/// A rate for each result: lambda[0] to lambda[n - 1], in memory that kernels reach.
template <typename T>
struct poisson_v_gaussian_icdf_based {
  using source = float;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  const double* lambda;
  float r0;
  float r1;
  std::uint64_t n;

  real_range<float> range() const { return {r0, r1}; }

  /// Past the last rate there is no result to be had, and 0 stands for it.
  SYCL_EXTERNAL T at(float u, std::uint64_t index) const {
    return index < n ? result(u, lambda[index]) : T{0};
  }

 private:
  static constexpr std::uint64_t last_row = 17;

  SYCL_EXTERNAL static T result(float u, double rate) {
    return rate < 0.0625 ? small(u, rate)
                         : count_above<T>(inverse_of(rate)(static_cast<double>(normal_deviate(u))));
  }

  /// As poisson_small_rate, from |u|, which is uniform as well; it ends at 11, too. The exponential
  /// has a fourth power of the rate and no third, and falls short by up to 4e-5: results depend on
  /// it.
  SYCL_EXTERNAL static T small(float u, double rate) {
    const double total =
        sycl::mad(sycl::mad(sycl::mad(rate * 0.16669916415448055, rate, 0.49999555884885266), rate,
                            1.0000002352041819),
                  rate, 0.99999999789769289);
    const double w = total * static_cast<double>(sycl::fabs(u));
    int k = 0;
    double sum = 1;
    double term = 1;
    while (k < 11 && !(w <= sum)) {
      ++k;
      term *= rate / k;
      sum += term;
    }
    return static_cast<T>(k);
  }

  /// Rates from 2^13 on share the last row, which is next to nothing for them: results depend on
  /// it.
  SYCL_EXTERNAL static poisson_inverse<double> inverse_of(double rate) {
    static constexpr auto table = constants_of(poisson_v_interval_constants);
    constexpr std::uint64_t row = 20;
    const auto bits = sycl::bit_cast<std::uint64_t>(rate);
    const std::uint64_t octave = (bits >> 52) - 1019;
    const double t = sycl::bit_cast<double>((bits & 0xFFFFFFFFFFFFFu) | 0x3FF0000000000000u) - 1;
    const double* c = table.at + row * (octave < last_row ? octave : last_row);
    const double a = sycl::mad(t, c[1], rate + c[0]);
    const double b = sycl::sqrt(rate) + sycl::mad(t, c[3], c[2]);
    return {a, b, c + 4, t};
  }
};

}  // namespace kestrel::tarn::rng::detail::gpu
