// SPDX-License-Identifier: Apache-2.0
// Constructors of all distribution classes, with the checks of their parameters. The conditions
// and the words of the messages are part of the contract, the odd ones included: callers compare
// them as text. Where results are drawn by rejection, what could never be accepted is refused here,
// as a device would go on drawing for ever: hence the conditions that a NaN fails.
#include <algorithm>
#include <cmath>
#include <cstddef>
#include <limits>
#include <string>

#include <kestrel/tarn/exceptions.hpp>

#include "frame/rows.hpp"

namespace kestrel::tarn::rng {
namespace {

void refuse_if(bool bad, const char* distribution, const char* text) {
  if (bad) {
    throw invalid_argument("rng", distribution, text);
  }
}

/// Number of stored entries of a factor; the greatest size_t where the product does not fit, which
/// no vector has.
std::size_t matrix_size(std::size_t dimension, matrix_layout layout) {
  if (layout == matrix_layout::diagonal || dimension == 0) {
    return dimension;
  }
  const std::size_t limit = std::numeric_limits<std::size_t>::max();
  if (dimension + 1 > limit / dimension) {
    return limit;
  }
  return layout == matrix_layout::full ? dimension * dimension : dimension * (dimension + 1) / 2;
}

}  // namespace

template <typename Type, typename Method>
uniform<Type, Method>::uniform(Type a, Type b) : a_(a), b_(b) {}

template <typename RealType, typename Method>
gaussian<RealType, Method>::gaussian(RealType mean, RealType stddev)
    : mean_(mean), stddev_(stddev) {}

template <typename RealType, typename Method>
lognormal<RealType, Method>::lognormal(RealType m, RealType s, RealType displ, RealType scale)
    : m_(m), s_(s), displ_(displ), scale_(scale) {}

template <typename RealType, typename Method>
exponential<RealType, Method>::exponential(RealType a, RealType beta) : a_(a), beta_(beta) {
  refuse_if(beta <= RealType(0), "exponential", "beta <= 0");
}

template <typename RealType, typename Method>
gamma<RealType, Method>::gamma(RealType alpha, RealType a, RealType beta)
    : alpha_(alpha), a_(a), beta_(beta) {
  refuse_if(!(alpha > RealType(0)), "gamma", "alpha <= 0");
  refuse_if(beta <= RealType(0), "gamma", "beta <= 0");
}

template <typename RealType, typename Method>
beta<RealType, Method>::beta(RealType p, RealType q, RealType a, RealType b)
    : p_(p), q_(q), a_(a), b_(b) {
  refuse_if(p <= RealType(0), "beta", "p <= 0");
  refuse_if(q <= RealType(0), "beta", "q <= 0");
  refuse_if(std::isinf(p) || std::isinf(q), "beta", "p or q is infinite");
}

template <typename RealType, typename Method>
chi_square<RealType, Method>::chi_square(std::int32_t n) : n_(n) {
  refuse_if(n < 1, "chi_square", "n < 1");
}

template <typename RealType, typename Method>
weibull<RealType, Method>::weibull(RealType alpha, RealType a, RealType beta)
    : alpha_(alpha), a_(a), beta_(beta) {}

template <typename RealType, typename Method>
rayleigh<RealType, Method>::rayleigh(RealType a, RealType b)
    : detail::location_scale<RealType, Method>(a, b) {}

template <typename RealType, typename Method>
gumbel<RealType, Method>::gumbel(RealType a, RealType b)
    : detail::location_scale<RealType, Method>(a, b) {}

template <typename RealType, typename Method>
laplace<RealType, Method>::laplace(RealType a, RealType b)
    : detail::location_scale<RealType, Method>(a, b) {}

template <typename RealType, typename Method>
cauchy<RealType, Method>::cauchy(RealType a, RealType b)
    : detail::location_scale<RealType, Method>(a, b) {}

template <typename RealType, matrix_layout Layout, typename Method>
gaussian_mv<RealType, Layout, Method>::gaussian_mv(std::uint32_t dimension,
                                                   const std::vector<RealType>& mean,
                                                   const std::vector<RealType>& matrix)
    : dimension_(dimension), mean_(mean), matrix_(matrix) {
  refuse_if(mean.size() != dimension, "gaussian_mv", "'mean' vector size is incorrect");
  refuse_if(matrix.size() != matrix_size(dimension, Layout), "gaussian_mv",
            "'matrix' size is incorrect");
}

template <typename IntType, typename Method>
poisson<IntType, Method>::poisson(double lambda) : lambda_(lambda) {
  refuse_if(lambda <= 0.0, "poisson", "lamdba < 0");
}

template <typename IntType, typename Method>
poisson_v<IntType, Method>::poisson_v(const std::vector<double>& lambda) : lambda_(lambda) {
  refuse_if(lambda.empty(), "poisson_v", "size of lambda < 0");
}

template <typename IntType, typename Method>
binomial<IntType, Method>::binomial(std::int32_t ntrial, double p) : ntrial_(ntrial), p_(p) {
  refuse_if(ntrial < 0, "binomial", "ntrial < 0");
  refuse_if(!(p >= 0.0 && p <= 1.0), "binomial", "p > 1 or p < 0");
}

template <typename IntType, typename Method>
negative_binomial<IntType, Method>::negative_binomial(double a, double p) : a_(a), p_(p) {
  refuse_if(!(a > 0.0), "negative_binomial", "a <= 0");
  refuse_if(std::isinf(a), "negative_binomial", "a is infinite");
  refuse_if(!(p > 0.0 && p <= 1.0), "negative_binomial", "p > 1 or p <= 0");
}

template <typename IntType, typename Method>
hypergeometric<IntType, Method>::hypergeometric(std::int32_t l, std::int32_t s, std::int32_t m)
    : l_(l), s_(s), m_(m) {
  refuse_if(s < 0, "hypergeometric", "s < 0");
  refuse_if(m < 0, "hypergeometric", "m < 0");
  refuse_if(l < std::max(s, m), "hypergeometric", "l < (s > m ? s : m)");
}

template <typename IntType, typename Method>
multinomial<IntType, Method>::multinomial(std::int32_t ntrial, const std::vector<double>& p)
    : ntrial_(ntrial), p_(p) {}

template <typename IntType, typename Method>
geometric<IntType, Method>::geometric(double p) : p_(p) {
  refuse_if(p >= 1.0 || p <= 0.0, "geometric", "p > 1 or p < 0");
}

template <typename IntType, typename Method>
bernoulli<IntType, Method>::bernoulli(double p) : p_(p) {
  refuse_if(p > 1.0 || p < 0.0, "bernoulli", "p > 1 or p < 0");
}

// `bits` and `uniform_bits` have no constructors and their instantiation emits nothing.
#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) \
  template class TARN_UNWRAP type;
#include "distributions/distributions.def"

}  // namespace kestrel::tarn::rng
