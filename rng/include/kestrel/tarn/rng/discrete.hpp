// SPDX-License-Identifier: Apache-2.0
// Discrete distributions: parameters only. Drawing is in generate.hpp; every class keeps the values
// given at construction and refuses those outside their ranges with invalid_argument.
#pragma once

#include <cstdint>
#include <vector>

#include <kestrel/tarn/export.hpp>
#include <kestrel/tarn/rng/detail/type_list.hpp>

namespace kestrel::tarn::rng {

namespace poisson_method {
struct TARN_EXPORT ptpe {};                 // transformed rejection; CPU queues only
struct TARN_EXPORT gaussian_icdf_based {};  // one word, one result; an approximation
}  // namespace poisson_method

/// Poisson of rate `lambda` > 0.
template <typename IntType = std::int32_t, typename Method = poisson_method::gaussian_icdf_based>
class TARN_EXPORT poisson {
  static_assert(detail::is_integer_result<IntType>,
                "poisson: the result type is std::int32_t or std::uint32_t");
  static_assert(
      detail::is_one_of<Method, poisson_method::ptpe, poisson_method::gaussian_icdf_based>,
      "poisson: no such method");

 public:
  using result_type = IntType;
  using method_type = Method;

  explicit poisson(double lambda = 1.0);

  double lambda() const { return lambda_; }

 private:
  double lambda_;
};

namespace poisson_v_method {
struct TARN_EXPORT gaussian_icdf_based {};
}  // namespace poisson_v_method

/// Poisson with a rate of its own for each result: `lambda` holds one rate per result, so its size
/// must equal the count given to generate.
template <typename IntType = std::int32_t, typename Method = poisson_v_method::gaussian_icdf_based>
class TARN_EXPORT poisson_v {
  static_assert(detail::is_integer_result<IntType>,
                "poisson_v: the result type is std::int32_t or std::uint32_t");
  static_assert(detail::is_one_of<Method, poisson_v_method::gaussian_icdf_based>,
                "poisson_v: no such method");

 public:
  using result_type = IntType;
  using method_type = Method;

  explicit poisson_v(const std::vector<double>& lambda);

  const std::vector<double>& lambda() const { return lambda_; }

 private:
  std::vector<double> lambda_;
};

namespace binomial_method {
struct TARN_EXPORT btpe {};  // Kachitvichyanukul and Schmeiser 1988
}  // namespace binomial_method

/// Successes in `ntrial` trials of probability `p`.
template <typename IntType = std::int32_t, typename Method = binomial_method::btpe>
class TARN_EXPORT binomial {
  static_assert(detail::is_integer_result<IntType>,
                "binomial: the result type is std::int32_t or std::uint32_t");
  static_assert(detail::is_one_of<Method, binomial_method::btpe>, "binomial: no such method");

 public:
  using result_type = IntType;
  using method_type = Method;

  explicit binomial(std::int32_t ntrial = 5, double p = 0.5);

  std::int32_t ntrial() const { return ntrial_; }
  double p() const { return p_; }

 private:
  std::int32_t ntrial_;
  double p_;
};

namespace negative_binomial_method {
struct TARN_EXPORT nbar {};
}  // namespace negative_binomial_method

/// Failures before success number `a` (real, > 0) in trials of probability `p`.
template <typename IntType = std::int32_t, typename Method = negative_binomial_method::nbar>
class TARN_EXPORT negative_binomial {
  static_assert(detail::is_integer_result<IntType>,
                "negative_binomial: the result type is std::int32_t or std::uint32_t");
  static_assert(detail::is_one_of<Method, negative_binomial_method::nbar>,
                "negative_binomial: no such method");

 public:
  using result_type = IntType;
  using method_type = Method;

  explicit negative_binomial(double a = 1.0, double p = 0.5);

  double a() const { return a_; }
  double p() const { return p_; }

 private:
  double a_;
  double p_;
};

namespace hypergeometric_method {
struct TARN_EXPORT h2pe {};  // Kachitvichyanukul and Schmeiser 1985
}  // namespace hypergeometric_method

/// Marked items in a sample of `s` from a lot of `l` items of which `m` are marked.
template <typename IntType = std::int32_t, typename Method = hypergeometric_method::h2pe>
class TARN_EXPORT hypergeometric {
  static_assert(detail::is_integer_result<IntType>,
                "hypergeometric: the result type is std::int32_t or std::uint32_t");
  static_assert(detail::is_one_of<Method, hypergeometric_method::h2pe>,
                "hypergeometric: no such method");

 public:
  using result_type = IntType;
  using method_type = Method;

  explicit hypergeometric(std::int32_t l = 2, std::int32_t s = 1, std::int32_t m = 1);

  std::int32_t l() const { return l_; }
  std::int32_t s() const { return s_; }
  std::int32_t m() const { return m_; }

 private:
  std::int32_t l_;
  std::int32_t s_;
  std::int32_t m_;
};

namespace multinomial_method {
struct TARN_EXPORT poisson_icdf_based {};
}  // namespace multinomial_method

/// Counts of `ntrial` trials over p.size() categories of probabilities `p`: one result is a row of
/// p.size() counts.
template <typename IntType = std::int32_t, typename Method = multinomial_method::poisson_icdf_based>
class TARN_EXPORT multinomial {
  static_assert(detail::is_integer_result<IntType>,
                "multinomial: the result type is std::int32_t or std::uint32_t");
  static_assert(detail::is_one_of<Method, multinomial_method::poisson_icdf_based>,
                "multinomial: no such method");

 public:
  using result_type = IntType;
  using method_type = Method;

  explicit multinomial(std::int32_t ntrial, const std::vector<double>& p);

  std::int32_t ntrial() const { return ntrial_; }
  const std::vector<double>& p() const { return p_; }

 private:
  std::int32_t ntrial_;
  std::vector<double> p_;
};

namespace geometric_method {
struct TARN_EXPORT icdf {};
}  // namespace geometric_method

/// Failures before the first success in trials of probability `p`, 0 < p < 1.
template <typename IntType = std::int32_t, typename Method = geometric_method::icdf>
class TARN_EXPORT geometric {
  static_assert(detail::is_integer_result<IntType>,
                "geometric: the result type is std::int32_t or std::uint32_t");
  static_assert(detail::is_one_of<Method, geometric_method::icdf>, "geometric: no such method");

 public:
  using result_type = IntType;
  using method_type = Method;

  explicit geometric(double p = 0.5);

  double p() const { return p_; }

 private:
  double p_;
};

namespace bernoulli_method {
struct TARN_EXPORT icdf {};
}  // namespace bernoulli_method

/// 1 with probability `p`, otherwise 0; 0 <= p <= 1.
template <typename IntType = std::int32_t, typename Method = bernoulli_method::icdf>
class TARN_EXPORT bernoulli {
  static_assert(detail::is_integer_result<IntType>,
                "bernoulli: the result type is std::int32_t or std::uint32_t");
  static_assert(detail::is_one_of<Method, bernoulli_method::icdf>, "bernoulli: no such method");

 public:
  using result_type = IntType;
  using method_type = Method;

  explicit bernoulli(double p = 0.5);

  double p() const { return p_; }

 private:
  double p_;
};

}  // namespace kestrel::tarn::rng
