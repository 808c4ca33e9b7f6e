// SPDX-License-Identifier: Apache-2.0
// Every offload routine with every method that it takes: arguments, and the distribution that
// `generate` draws with the same parameters. Codes and the order of arguments are written here as
// the manual has them, so that a wrong method or two swapped arguments show.
#pragma once

#include <cstdint>
#include <tarn_rvx.h>
#include <tuple>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include "calls.hpp"
#include "entries.hpp"

namespace tarn_test {

/// What n results take of the engine.
enum class taken { one_word, two_words, by_parameters, by_rejection };

template <typename Entries, typename Distr, typename... Argument>
struct drawing {
  using entries = Entries;
  using value = typename Entries::value;

  std::int64_t method;
  std::int64_t width;  // values of one result
  taken words;         // for each value
  Distr distr;
  std::tuple<Argument...> arguments;

  template <typename Entry>
  int draw(Entry entry, rvx_stream stream, std::int64_t n, value* r, void* interop) const {
    return std::apply(
        [&](const Argument&... argument) {
          return call(entry, method, stream, n, r, argument..., interop);
        },
        arguments);
  }
};

template <typename Entries, typename Distr, typename... Argument>
drawing<Entries, Distr, Argument...> drawing_of(std::int64_t method, taken words,
                                                const Distr& distr, Argument... argument) {
  return {method, 1, words, distr, {argument...}};
}

constexpr std::int64_t accuracy = RVX_RNG_METHOD_ACCURACY_FLAG;

template <typename Real, typename Visit>
void for_every_gaussian(const Visit& visit) {
  namespace rng = kestrel::tarn::rng;
  namespace m = rng::gaussian_method;
  const Real mean = Real(1.5);
  const Real stddev = Real(0.25);
  using entries = offload::Gaussian<Real>;
  visit(drawing_of<entries>(0, taken::two_words, rng::gaussian<Real, m::box_muller>(mean, stddev),
                            mean, stddev));
  visit(drawing_of<entries>(1, taken::one_word, rng::gaussian<Real, m::box_muller2>(mean, stddev),
                            mean, stddev));
  visit(drawing_of<entries>(2, taken::one_word, rng::gaussian<Real, m::icdf>(mean, stddev), mean,
                            stddev));
}

template <typename Real, kestrel::tarn::rng::matrix_layout layout, typename Visit>
void for_every_gaussian_mv(const std::vector<Real>& factor, const Visit& visit) {
  namespace rng = kestrel::tarn::rng;
  namespace m = rng::gaussian_mv_method;
  static const std::vector<Real> mean = {Real(-1), Real(2)};
  const auto each = [&](auto method, std::int64_t code) {
    auto drawn = drawing_of<offload::GaussianMV<Real>>(
        code, code == 0 ? taken::two_words : taken::one_word,
        rng::gaussian_mv<Real, layout, decltype(method)>(2, mean, factor), 2,
        static_cast<int>(layout), mean.data(), factor.data());
    drawn.width = 2;
    visit(drawn);
  };
  each(m::box_muller(), 0);
  each(m::box_muller2(), 1);
  each(m::icdf(), 2);
}

template <typename Real, typename Visit>
void for_every_accurate_pair(const Visit& visit) {
  namespace rng = kestrel::tarn::rng;
  const auto both = [&](auto entries, taken words, const auto& standard, const auto& accurate,
                        auto... argument) {
    visit(drawing_of<decltype(entries)>(0, words, standard, argument...));
    visit(drawing_of<decltype(entries)>(accuracy, words, accurate, argument...));
  };
  const Real half = Real(0.5);
  const Real least = Real(-1);
  const Real scale = Real(2.5);
  both(offload::Uniform<Real>(), taken::one_word, rng::uniform<Real>(3, 1000),
       rng::uniform<Real, rng::uniform_method::accurate>(3, 1000), 3, 1000);
  both(offload::Lognormal<Real>(), taken::one_word, rng::lognormal<Real>(half, scale, -3, 2),
       rng::lognormal<Real, rng::lognormal_method::box_muller2_accurate>(half, scale, -3, 2), half,
       scale, -3, 2);
  both(offload::Exponential<Real>(), taken::one_word, rng::exponential<Real>(least, scale),
       rng::exponential<Real, rng::exponential_method::icdf_accurate>(least, scale), least, scale);
  both(offload::Gamma<Real>(), taken::by_rejection, rng::gamma<Real>(scale, least, half),
       rng::gamma<Real, rng::gamma_method::marsaglia_accurate>(scale, least, half), scale, least,
       half);
  both(offload::Beta<Real>(), taken::by_rejection, rng::beta<Real>(scale, half, least, 3),
       rng::beta<Real, rng::beta_method::cja_accurate>(scale, half, least, 3), scale, half, least,
       3);
  both(offload::Weibull<Real>(), taken::one_word, rng::weibull<Real>(scale, least, half),
       rng::weibull<Real, rng::weibull_method::icdf_accurate>(scale, least, half), scale, least,
       half);
  both(offload::Rayleigh<Real>(), taken::one_word, rng::rayleigh<Real>(least, scale),
       rng::rayleigh<Real, rng::rayleigh_method::icdf_accurate>(least, scale), least, scale);
}

template <typename Real, typename Visit>
void for_every_real_drawing(const Visit& visit) {
  namespace rng = kestrel::tarn::rng;
  using layout = rng::matrix_layout;
  static const std::vector<Real> full = {Real(1.5), 0, Real(0.5), Real(0.75)};
  static const std::vector<Real> packed = {Real(1.5), Real(0.5), Real(0.75)};
  static const std::vector<Real> diagonal = {Real(1.5), Real(0.75)};
  const Real scale = Real(2.5);
  for_every_accurate_pair<Real>(visit);
  for_every_gaussian<Real>(visit);
  for_every_gaussian_mv<Real, layout::full>(full, visit);
  for_every_gaussian_mv<Real, layout::packed>(packed, visit);
  for_every_gaussian_mv<Real, layout::diagonal>(diagonal, visit);
  visit(drawing_of<offload::ChiSquare<Real>>(0, taken::by_rejection, rng::chi_square<Real>(5), 5));
  visit(drawing_of<offload::ChiSquare<Real>>(0, taken::by_parameters, rng::chi_square<Real>(4), 4));
  visit(drawing_of<offload::Gumbel<Real>>(0, taken::one_word, rng::gumbel<Real>(-1, scale), -1,
                                          scale));
  visit(drawing_of<offload::Laplace<Real>>(0, taken::two_words, rng::laplace<Real>(-1, scale), -1,
                                           scale));
  visit(drawing_of<offload::Cauchy<Real>>(0, taken::one_word, rng::cauchy<Real>(-1, scale), -1,
                                          scale));
}

/// Rates for n results.
inline std::vector<double> rates_of(std::int64_t n) {
  std::vector<double> rates;
  for (std::int64_t i = 0; i < n; ++i) {
    rates.push_back(0.5 + static_cast<double>(i % 50));
  }
  return rates;
}

/// For n results, of which there is at least one.
template <typename Visit>
void for_every_integer_drawing(std::int64_t n, const Visit& visit) {
  namespace rng = kestrel::tarn::rng;
  using namespace offload;
  visit(drawing_of<viUniform>(0, taken::one_word, rng::uniform<std::int32_t>(-3, 1000), -3, 1000));
  visit(drawing_of<viUniformBits32>(0, taken::one_word, rng::uniform_bits<std::uint32_t>()));
  visit(drawing_of<viUniformBits64>(0, taken::two_words, rng::uniform_bits<std::uint64_t>()));
  visit(drawing_of<viBernoulli>(0, taken::one_word, rng::bernoulli<>(0.3), 0.3));
  visit(drawing_of<viBinomial>(0, taken::by_rejection, rng::binomial<>(200, 0.3), 200, 0.3));
  visit(drawing_of<viBinomial>(0, taken::one_word, rng::binomial<>(20, 0.3), 20, 0.3));
  visit(drawing_of<viGeometric>(0, taken::one_word, rng::geometric<>(0.2), 0.2));
  visit(drawing_of<viHypergeometric>(0, taken::by_rejection, rng::hypergeometric<>(500, 200, 150),
                                     500, 200, 150));
  visit(drawing_of<viHypergeometric>(0, taken::one_word, rng::hypergeometric<>(50, 5, 10), 50, 5,
                                     10));
  visit(drawing_of<viNegbinomial>(0, taken::by_rejection, rng::negative_binomial<>(200, 0.5), 200,
                                  0.5));
  visit(
      drawing_of<viNegbinomial>(0, taken::one_word, rng::negative_binomial<>(3.5, 0.4), 3.5, 0.4));
  visit(drawing_of<viPoisson>(1, taken::one_word, rng::poisson<>(40.5), 40.5));
  const std::vector<double> rates = rates_of(n);
  visit(drawing_of<viPoissonV>(0, taken::one_word, rng::poisson_v<>(rates), rates.data()));
  static const std::vector<double> categories(32, 0x1p-5);
  auto rows = drawing_of<viMultinomial>(0, taken::by_parameters, rng::multinomial<>(2, categories),
                                        2, 32, categories.data());
  rows.width = 32;
  visit(rows);
}

/// All but raw words, whose width hangs on the engine.
template <typename Visit>
void for_every_drawing(std::int64_t n, const Visit& visit) {
  for_every_real_drawing<float>(visit);
  for_every_real_drawing<double>(visit);
  for_every_integer_drawing(n, visit);
}

/// Raw words of an engine that stores each in so many 32-bit numbers.
inline auto raw_words(std::int64_t stored) {
  auto drawn = drawing_of<offload::viUniformBits>(0, taken::one_word, kestrel::tarn::rng::bits<>());
  drawn.width = stored;
  return drawn;
}

}  // namespace tarn_test
