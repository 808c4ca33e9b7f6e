// SPDX-License-Identifier: Apache-2.0
// What each routine draws: the look at its parameters, which comes before all else, and the
// distributions that its methods stand for. The narrower conditions of a distribution's constructor
// come later, as exceptions.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <tarn_rvx.h>
#include <vector>

#include <kestrel/tarn/rng/distributions.hpp>

#include "entry.hpp"

namespace kestrel::tarn::rng::detail::openmp {

inline constexpr std::int64_t accurate = RVX_RNG_METHOD_ACCURACY_FLAG;

/// Draws `Distr` made from the arguments.
template <typename Distr, typename... Argument>
int draw_from(const call<typename Distr::result_type>& asked, const Argument&... arguments) {
  return run(asked, [&] { return Distr(arguments...); });
}

/// The same for families with an accurate method beside another one.
template <typename Plain, typename Accurate, typename T, typename... Argument>
int draw_accurately_or_not(const call<T>& asked, const Argument&... arguments) {
  switch (asked.method) {
    case RVX_RNG_METHOD_STANDARD:
      return draw_from<Plain>(asked, arguments...);
    case accurate:
      return draw_from<Accurate>(asked, arguments...);
    default:
      return refused;
  }
}

/// The same for families of one method, whose code is 0.
template <typename Distr, typename... Argument>
int draw_by_one_method(const call<typename Distr::result_type>& asked,
                       const Argument&... arguments) {
  return asked.method == RVX_RNG_METHOD_STANDARD ? draw_from<Distr>(asked, arguments...) : refused;
}

/// Distributions take integers of 32 bits, entries also wider ones.
inline bool fits(std::int64_t value) {
  return value >= std::numeric_limits<std::int32_t>::min() &&
         value <= std::numeric_limits<std::int32_t>::max();
}
inline std::int32_t narrow(std::int64_t value) {
  return static_cast<std::int32_t>(value);
}

template <typename T>
int uniform(const call<T>& asked, T a, T b) {
  if (a >= b) {
    return refused;
  }
  return draw_accurately_or_not<rng::uniform<T, uniform_method::standard>,
                                rng::uniform<T, uniform_method::accurate>>(asked, a, b);
}

template <typename T>
int uniform_integers(const call<T>& asked, std::int64_t a, std::int64_t b) {
  if (a >= b || !fits(a) || !fits(b)) {
    return refused;
  }
  return draw_by_one_method<rng::uniform<T, uniform_method::standard>>(asked, narrow(a), narrow(b));
}

template <typename T>
int raw_bits(const call<T>& asked) {
  return draw_by_one_method<bits<T>>(asked);
}

template <typename T>
int fair_bits(const call<T>& asked) {
  return draw_by_one_method<uniform_bits<T>>(asked);
}

template <typename T>
int gaussian(const call<T>& asked, T mean, T stddev) {
  if (stddev <= 0) {
    return refused;
  }
  switch (asked.method) {
    case RVX_RNG_METHOD_GAUSSIAN_BOXMULLER:
      return draw_from<rng::gaussian<T, gaussian_method::box_muller>>(asked, mean, stddev);
    case RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2:
      return draw_from<rng::gaussian<T, gaussian_method::box_muller2>>(asked, mean, stddev);
    case RVX_RNG_METHOD_GAUSSIAN_ICDF:
      return draw_from<rng::gaussian<T, gaussian_method::icdf>>(asked, mean, stddev);
    default:
      return refused;
  }
}

/// Entries of the factor T in its layout.
inline std::size_t factor_size(std::size_t dimension, matrix_layout layout) {
  switch (layout) {
    case matrix_layout::full:
      return dimension * dimension;
    case matrix_layout::packed:
      return dimension * (dimension + 1) / 2;
    default:
      return dimension;
  }
}

template <matrix_layout layout, typename Method, typename T>
int vectors(const call<T>& asked, std::int64_t dimension, const T* mean, const T* matrix) {
  return run(asked, [&] {
    const auto size = static_cast<std::size_t>(dimension);
    return rng::gaussian_mv<T, layout, Method>(
        static_cast<std::uint32_t>(dimension), std::vector<T>(mean, mean + size),
        std::vector<T>(matrix, matrix + factor_size(size, layout)));
  });
}

template <matrix_layout layout, typename T>
int vectors(const call<T>& asked, std::int64_t dimension, const T* mean, const T* matrix) {
  switch (asked.method) {
    case RVX_RNG_METHOD_GAUSSIAN_BOXMULLER:
      return vectors<layout, gaussian_mv_method::box_muller>(asked, dimension, mean, matrix);
    case RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2:
      return vectors<layout, gaussian_mv_method::box_muller2>(asked, dimension, mean, matrix);
    case RVX_RNG_METHOD_GAUSSIAN_ICDF:
      return vectors<layout, gaussian_mv_method::icdf>(asked, dimension, mean, matrix);
    default:
      return refused;
  }
}

template <typename T>
int gaussian_mv(const call<T>& asked, std::int64_t dimension, std::int64_t layout, const T* mean,
                const T* matrix) {
  if (dimension < 1 || !fits(dimension) || mean == nullptr || matrix == nullptr) {
    return refused;
  }
  switch (layout) {
    case static_cast<std::int64_t>(matrix_layout::full):
      return vectors<matrix_layout::full>(asked, dimension, mean, matrix);
    case static_cast<std::int64_t>(matrix_layout::packed):
      return vectors<matrix_layout::packed>(asked, dimension, mean, matrix);
    case static_cast<std::int64_t>(matrix_layout::diagonal):
      return vectors<matrix_layout::diagonal>(asked, dimension, mean, matrix);
    default:
      return refused;
  }
}

/// The code of inversion is not taken; on devices the accurate method is inversion.
template <typename T>
int lognormal(const call<T>& asked, T m, T s, T displ, T scale) {
  if (s <= 0 || scale <= 0) {
    return refused;
  }
  return draw_accurately_or_not<rng::lognormal<T, lognormal_method::box_muller2>,
                                rng::lognormal<T, lognormal_method::box_muller2_accurate>>(
      asked, m, s, displ, scale);
}

template <typename T>
int exponential(const call<T>& asked, T a, T beta) {
  if (beta <= 0) {
    return refused;
  }
  return draw_accurately_or_not<rng::exponential<T, exponential_method::icdf>,
                                rng::exponential<T, exponential_method::icdf_accurate>>(asked, a,
                                                                                        beta);
}

template <typename T>
int gamma(const call<T>& asked, T alpha, T a, T beta) {
  if (alpha <= 0 || beta <= 0) {
    return refused;
  }
  return draw_accurately_or_not<rng::gamma<T, gamma_method::marsaglia>,
                                rng::gamma<T, gamma_method::marsaglia_accurate>>(asked, alpha, a,
                                                                                 beta);
}

template <typename T>
int beta(const call<T>& asked, T p, T q, T a, T b) {
  if (p <= 0 || q <= 0 || b <= 0) {
    return refused;
  }
  return draw_accurately_or_not<rng::beta<T, beta_method::cja>,
                                rng::beta<T, beta_method::cja_accurate>>(asked, p, q, a, b);
}

template <typename T>
int chi_square(const call<T>& asked, std::int64_t degrees) {
  if (degrees < 1 || !fits(degrees)) {
    return refused;
  }
  return draw_by_one_method<rng::chi_square<T, chi_square_method::gamma_based>>(asked,
                                                                                narrow(degrees));
}

template <typename T>
int weibull(const call<T>& asked, T alpha, T a, T beta) {
  if (alpha <= 0 || beta <= 0) {
    return refused;
  }
  return draw_accurately_or_not<rng::weibull<T, weibull_method::icdf>,
                                rng::weibull<T, weibull_method::icdf_accurate>>(asked, alpha, a,
                                                                                beta);
}

template <typename T>
int rayleigh(const call<T>& asked, T a, T b) {
  if (b <= 0) {
    return refused;
  }
  return draw_accurately_or_not<rng::rayleigh<T, rayleigh_method::icdf>,
                                rng::rayleigh<T, rayleigh_method::icdf_accurate>>(asked, a, b);
}

/// Families with a place and a scale, and one method.
template <typename Distr, typename T>
int place_and_scale(const call<T>& asked, T a, T b) {
  return b <= 0 ? static_cast<int>(refused) : draw_by_one_method<Distr>(asked, a, b);
}
template <typename T>
int gumbel(const call<T>& asked, T a, T b) {
  return place_and_scale<rng::gumbel<T, gumbel_method::icdf>>(asked, a, b);
}
template <typename T>
int laplace(const call<T>& asked, T a, T b) {
  return place_and_scale<rng::laplace<T, laplace_method::icdf>>(asked, a, b);
}
template <typename T>
int cauchy(const call<T>& asked, T a, T b) {
  return place_and_scale<rng::cauchy<T, cauchy_method::icdf>>(asked, a, b);
}

/// Families with one probability.
template <typename Distr>
int one_probability(const call<typename Distr::result_type>& asked, double p) {
  return p > 1 || p < 0 ? static_cast<int>(refused) : draw_by_one_method<Distr>(asked, p);
}
template <typename T>
int bernoulli(const call<T>& asked, double p) {
  return one_probability<rng::bernoulli<T, bernoulli_method::icdf>>(asked, p);
}
template <typename T>
int geometric(const call<T>& asked, double p) {
  return one_probability<rng::geometric<T, geometric_method::icdf>>(asked, p);
}

template <typename T>
int binomial(const call<T>& asked, std::int64_t ntrial, double p) {
  if (ntrial < 1 || !fits(ntrial) || p < 0 || p > 1) {
    return refused;
  }
  return draw_by_one_method<rng::binomial<T, binomial_method::btpe>>(asked, narrow(ntrial), p);
}

template <typename T>
int hypergeometric(const call<T>& asked, std::int64_t l, std::int64_t s, std::int64_t m) {
  if (s < 0 || m < 0 || std::max(s, m) > l || !fits(l)) {
    return refused;
  }
  return draw_by_one_method<rng::hypergeometric<T, hypergeometric_method::h2pe>>(
      asked, narrow(l), narrow(s), narrow(m));
}

template <typename T>
int negative_binomial(const call<T>& asked, double a, double p) {
  if (a <= 0 || p <= 0 || p >= 1) {
    return refused;
  }
  return draw_by_one_method<rng::negative_binomial<T, negative_binomial_method::nbar>>(asked, a, p);
}

template <typename T>
int multinomial(const call<T>& asked, std::int64_t ntrial, std::int64_t categories,
                const double* p) {
  if (ntrial < 0 || !fits(ntrial) || categories < 1 || !fits(categories) || p == nullptr ||
      asked.method != RVX_RNG_METHOD_STANDARD) {
    return refused;
  }
  using distribution = rng::multinomial<T, multinomial_method::poisson_icdf_based>;
  return run(asked,
             [&] { return distribution(narrow(ntrial), std::vector<double>(p, p + categories)); });
}

template <typename T>
int poisson(const call<T>& asked, double lambda) {
  if (lambda < 0 || asked.method != RVX_RNG_METHOD_POISSON_GAUSSIAN_ICDF) {
    return refused;
  }
  return draw_from<rng::poisson<T, poisson_method::gaussian_icdf_based>>(asked, lambda);
}

template <typename T>
int poisson_v(const call<T>& asked, const double* lambda) {
  if (asked.method != RVX_RNG_METHOD_STANDARD || (lambda == nullptr && asked.n > 0)) {
    return refused;
  }
  using distribution = rng::poisson_v<T, poisson_v_method::gaussian_icdf_based>;
  return run(asked, [&] {
    // There is no distribution without rates, so calls without results have one made up.
    return distribution(asked.n > 0 ? std::vector<double>(lambda, lambda + asked.n)
                                    : std::vector<double>{1.0});
  });
}

}  // namespace kestrel::tarn::rng::detail::openmp
