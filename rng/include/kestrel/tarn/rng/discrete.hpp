// SPDX-License-Identifier: Apache-2.0
// Discrete distributions: parameters only. Drawing is in generate.hpp; every class keeps the values
// given at construction. The manual has a page for each: probabilities, words consumed, method,
// accuracy. Results that a type cannot hold are its greatest value, on CPU queues for both types
// that of std::int32_t.
#pragma once

#include <cstdint>
#include <vector>

#include <kestrel/tarn/export.hpp>
#include <kestrel/tarn/rng/detail/type_list.hpp>

namespace kestrel::tarn::rng {

/// How poisson draws. Schmeiser and Kachitvichyanukul, Purdue Memorandum 81-4, 1981; Temme, SIAM J.
/// Math. Anal. 10, 1979.
namespace poisson_method {
/// Rejection, exact; CPU queues only.
struct TARN_EXPORT ptpe {};
/// One word, one result; an approximation.
struct TARN_EXPORT gaussian_icdf_based {};
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
  ///@{
  /// The argument of the template.
  using result_type = IntType;
  using method_type = Method;
  ///@}

  /// \param lambda  rate, finite and above 0
  ///
  /// Raises invalid_argument for lambda <= 0.
  explicit poisson(double lambda = 1.0);

  ///@{
  /// As given to the constructor.
  double lambda() const { return lambda_; }
  ///@}

 private:
  double lambda_;
};

/// How poisson_v draws.
namespace poisson_v_method {
/// One word, one result; an approximation.
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
  ///@{
  /// The argument of the template.
  using result_type = IntType;
  using method_type = Method;
  ///@}

  /// \param lambda  rates, each finite and above 0; as many as results are drawn
  ///
  /// Raises invalid_argument for an empty list.
  explicit poisson_v(const std::vector<double>& lambda);

  ///@{
  /// As given to the constructor.
  const std::vector<double>& lambda() const { return lambda_; }
  ///@}

 private:
  std::vector<double> lambda_;
};

/// How binomial draws. Kachitvichyanukul and Schmeiser, Comm. ACM 31, 1988.
namespace binomial_method {
/// Rejection; a table for small counts.
struct TARN_EXPORT btpe {};
}  // namespace binomial_method

/// Successes in `ntrial` trials of probability `p`.
template <typename IntType = std::int32_t, typename Method = binomial_method::btpe>
class TARN_EXPORT binomial {
  static_assert(detail::is_integer_result<IntType>,
                "binomial: the result type is std::int32_t or std::uint32_t");
  static_assert(detail::is_one_of<Method, binomial_method::btpe>, "binomial: no such method");

 public:
  ///@{
  /// The argument of the template.
  using result_type = IntType;
  using method_type = Method;
  ///@}

  /// \param ntrial  trials, 0 or more; a CPU queue reports 0 and draws nothing
  /// \param p       probability of a success, in [0, 1]
  ///
  /// Raises invalid_argument for ntrial < 0 and for a p outside [0, 1].
  explicit binomial(std::int32_t ntrial = 5, double p = 0.5);

  ///@{
  /// As given to the constructor.
  std::int32_t ntrial() const { return ntrial_; }
  double p() const { return p_; }
  ///@}

 private:
  std::int32_t ntrial_;
  double p_;
};

/// How negative_binomial draws.
namespace negative_binomial_method {
/// Rejection; a table for small counts.
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
  ///@{
  /// The argument of the template.
  using result_type = IntType;
  using method_type = Method;
  ///@}

  /// \param a  number of the last success, real, finite and above 0
  /// \param p  probability of a success, in (0, 1]
  ///
  /// Raises invalid_argument for parameters outside these ranges, and `generate` on a GPU queue for
  /// those whose hat does not stand in double precision (docs/distributions/devices.md).
  explicit negative_binomial(double a = 1.0, double p = 0.5);

  ///@{
  /// As given to the constructor.
  double a() const { return a_; }
  double p() const { return p_; }
  ///@}

 private:
  double a_;
  double p_;
};

/// How hypergeometric draws. Kachitvichyanukul and Schmeiser, J. Stat. Comput. Simul. 22, 1985.
namespace hypergeometric_method {
/// Rejection; a table for small counts.
struct TARN_EXPORT h2pe {};
}  // namespace hypergeometric_method

/// Marked items in a sample of `s` from a lot of `l` items of which `m` are marked.
template <typename IntType = std::int32_t, typename Method = hypergeometric_method::h2pe>
class TARN_EXPORT hypergeometric {
  static_assert(detail::is_integer_result<IntType>,
                "hypergeometric: the result type is std::int32_t or std::uint32_t");
  static_assert(detail::is_one_of<Method, hypergeometric_method::h2pe>,
                "hypergeometric: no such method");

 public:
  ///@{
  /// The argument of the template.
  using result_type = IntType;
  using method_type = Method;
  ///@}

  /// \param l  items in the lot
  /// \param s  items in the sample, 0 to l
  /// \param m  marked items in the lot, 0 to l
  ///
  /// Raises invalid_argument for s < 0, m < 0, l < s and l < m.
  explicit hypergeometric(std::int32_t l = 2, std::int32_t s = 1, std::int32_t m = 1);

  ///@{
  /// As given to the constructor.
  std::int32_t l() const { return l_; }
  std::int32_t s() const { return s_; }
  std::int32_t m() const { return m_; }
  ///@}

 private:
  std::int32_t l_;
  std::int32_t s_;
  std::int32_t m_;
};

/// How multinomial draws: trial by trial from a table (Chen and Asau, AIIE Transactions 6, 1974) or
/// by conditional binomials (Davis, Comput. Stat. Data Anal. 16, 1993).
namespace multinomial_method {
/// The words that a row takes vary.
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
  ///@{
  /// The argument of the template.
  using result_type = IntType;
  using method_type = Method;
  ///@}

  /// \param ntrial  trials in a row, 0 or more
  /// \param p       probabilities of the categories, at least one, none negative, with sum 1
  ///
  /// Raises nothing: a CPU queue reports other parameters and draws nothing. `generate` on a GPU
  /// queue raises invalid_argument for more than 16 trials, for fewer than 16 categories a trial,
  /// and for counts below 0.
  explicit multinomial(std::int32_t ntrial, const std::vector<double>& p);

  ///@{
  /// As given to the constructor.
  std::int32_t ntrial() const { return ntrial_; }
  const std::vector<double>& p() const { return p_; }
  ///@}

 private:
  std::int32_t ntrial_;
  std::vector<double> p_;
};

/// How geometric draws.
namespace geometric_method {
/// Inversion: one word, one result.
struct TARN_EXPORT icdf {};
}  // namespace geometric_method

/// Failures before the first success in trials of probability `p`, 0 < p < 1.
template <typename IntType = std::int32_t, typename Method = geometric_method::icdf>
class TARN_EXPORT geometric {
  static_assert(detail::is_integer_result<IntType>,
                "geometric: the result type is std::int32_t or std::uint32_t");
  static_assert(detail::is_one_of<Method, geometric_method::icdf>, "geometric: no such method");

 public:
  ///@{
  /// The argument of the template.
  using result_type = IntType;
  using method_type = Method;
  ///@}

  /// \param p  probability of a success, in (0, 1)
  ///
  /// Raises invalid_argument for p <= 0 and p >= 1.
  explicit geometric(double p = 0.5);

  ///@{
  /// As given to the constructor.
  double p() const { return p_; }
  ///@}

 private:
  double p_;
};

/// How bernoulli draws.
namespace bernoulli_method {
/// Inversion: one word, one result.
struct TARN_EXPORT icdf {};
}  // namespace bernoulli_method

/// 1 with probability `p`, otherwise 0; 0 <= p <= 1.
template <typename IntType = std::int32_t, typename Method = bernoulli_method::icdf>
class TARN_EXPORT bernoulli {
  static_assert(detail::is_integer_result<IntType>,
                "bernoulli: the result type is std::int32_t or std::uint32_t");
  static_assert(detail::is_one_of<Method, bernoulli_method::icdf>, "bernoulli: no such method");

 public:
  ///@{
  /// The argument of the template.
  using result_type = IntType;
  using method_type = Method;
  ///@}

  /// \param p  probability of 1, in [0, 1]
  ///
  /// Raises invalid_argument for p < 0 and p > 1.
  explicit bernoulli(double p = 0.5);

  ///@{
  /// As given to the constructor.
  double p() const { return p_; }
  ///@}

 private:
  double p_;
};

}  // namespace kestrel::tarn::rng
