// SPDX-License-Identifier: Apache-2.0
// Continuous distributions: parameters only. Drawing is in generate.hpp; every class keeps the
// values given at construction. The manual has a page for each: density, words consumed, method,
// accuracy.
#pragma once

#include <limits>

#include <kestrel/tarn/export.hpp>
#include <kestrel/tarn/rng/detail/type_list.hpp>
#include <kestrel/tarn/rng/gamma_family.hpp>

namespace kestrel::tarn::rng {

/// How uniform draws: one word for one result.
namespace uniform_method {
/// Rounding may deliver the upper bound; of std::int32_t, which passes through float, bounds are
/// rounded as well.
struct TARN_EXPORT standard {};
/// Reals are clamped to [a, b]; integers are drawn in double precision, and a CPU queue truncates
/// them towards zero.
struct TARN_EXPORT accurate {};
}  // namespace uniform_method

namespace detail {
/// Upper bound of a default uniform: 1 for reals, the largest value for integers.
template <typename Type>
inline constexpr Type default_upper_bound = is_real_result<Type> ? Type(1)
                                                                 : std::numeric_limits<Type>::max();
}  // namespace detail

/// Uniform on [a, b); for integers the floor of a real uniform on [a, b). Of std::int32_t by the
/// accurate method a CPU queue truncates instead, which is not uniform when a < 0. a < b is
/// expected: a CPU queue reports anything else and draws nothing.
template <typename Type = float, typename Method = uniform_method::standard>
class TARN_EXPORT uniform {
  static_assert(detail::is_real_result<Type> || detail::is_integer_result<Type>,
                "uniform: the result type is float, double, std::int32_t or std::uint32_t");
  static_assert(detail::is_one_of<Method, uniform_method::standard, uniform_method::accurate>,
                "uniform: no such method");

 public:
  ///@{
  /// The argument of the template.
  using result_type = Type;
  using method_type = Method;
  ///@}

  /// \param a  least value
  /// \param b  upper bound, above a; b - a and a + b must be finite
  ///
  /// Raises nothing: a CPU queue reports other bounds and draws nothing.
  explicit uniform(Type a = Type(0), Type b = detail::default_upper_bound<Type>);

  ///@{
  /// As given to the constructor.
  Type a() const { return a_; }
  Type b() const { return b_; }
  ///@}

 private:
  Type a_;
  Type b_;
};

/// How gaussian draws. Box and Muller, Annals of Mathematical Statistics 29, 1958.
namespace gaussian_method {
/// Two words, one result.
struct TARN_EXPORT box_muller {};
/// Two words, two results.
struct TARN_EXPORT box_muller2 {};
/// Inversion: one word, one result.
struct TARN_EXPORT icdf {};
}  // namespace gaussian_method

/// Normal with mean `mean` and standard deviation `stddev`.
template <typename RealType = float, typename Method = gaussian_method::box_muller2>
class TARN_EXPORT gaussian {
  static_assert(detail::is_real_result<RealType>, "gaussian: the result type is float or double");
  static_assert(detail::is_one_of<Method, gaussian_method::box_muller, gaussian_method::box_muller2,
                                  gaussian_method::icdf>,
                "gaussian: no such method");

 public:
  ///@{
  /// The argument of the template.
  using result_type = RealType;
  using method_type = Method;
  ///@}

  /// \param mean    finite
  /// \param stddev  standard deviation, finite and above 0
  ///
  /// Raises nothing: a CPU queue reports other parameters and draws nothing.
  explicit gaussian(RealType mean = RealType(0), RealType stddev = RealType(1));

  ///@{
  /// As given to the constructor.
  RealType mean() const { return mean_; }
  RealType stddev() const { return stddev_; }
  ///@}

 private:
  RealType mean_;
  RealType stddev_;
};

/// How lognormal draws: as gaussian, then the exponential. An accurate method keeps results from
/// rounding below displ.
namespace lognormal_method {
/// Two words, two results.
struct TARN_EXPORT box_muller2 {};
/// The same, results never below displ.
struct TARN_EXPORT box_muller2_accurate {};
/// Inversion: one word, one result.
struct TARN_EXPORT icdf {};
/// The same, results never below displ.
struct TARN_EXPORT icdf_accurate {};
}  // namespace lognormal_method

/// displ + scale * exp(X) with X normal of mean `m` and standard deviation `s`.
template <typename RealType = float, typename Method = lognormal_method::box_muller2>
class TARN_EXPORT lognormal {
  static_assert(detail::is_real_result<RealType>, "lognormal: the result type is float or double");
  static_assert(detail::is_one_of<Method, lognormal_method::box_muller2,
                                  lognormal_method::box_muller2_accurate, lognormal_method::icdf,
                                  lognormal_method::icdf_accurate>,
                "lognormal: no such method");

 public:
  ///@{
  /// The argument of the template.
  using result_type = RealType;
  using method_type = Method;
  ///@}

  /// \param m      mean of the normal, finite
  /// \param s      its standard deviation, finite and above 0
  /// \param displ  displacement, finite
  /// \param scale  finite and above 0
  ///
  /// Raises nothing: a CPU queue reports other parameters and draws nothing.
  explicit lognormal(RealType m = RealType(0), RealType s = RealType(1),
                     RealType displ = RealType(0), RealType scale = RealType(1));

  ///@{
  /// As given to the constructor.
  RealType m() const { return m_; }
  RealType s() const { return s_; }
  RealType displ() const { return displ_; }
  RealType scale() const { return scale_; }
  ///@}

 private:
  RealType m_;
  RealType s_;
  RealType displ_;
  RealType scale_;
};

/// How exponential draws: one word, one result.
namespace exponential_method {
/// Inversion.
struct TARN_EXPORT icdf {};
/// Inversion; results never below a.
struct TARN_EXPORT icdf_accurate {};
}  // namespace exponential_method

/// Exponential with displacement `a` and scale `beta` > 0: mean a + beta.
template <typename RealType = float, typename Method = exponential_method::icdf>
class TARN_EXPORT exponential {
  static_assert(detail::is_real_result<RealType>,
                "exponential: the result type is float or double");
  static_assert(
      detail::is_one_of<Method, exponential_method::icdf, exponential_method::icdf_accurate>,
      "exponential: no such method");

 public:
  ///@{
  /// The argument of the template.
  using result_type = RealType;
  using method_type = Method;
  ///@}

  /// \param a     displacement, finite: the least value
  /// \param beta  scale, finite and above 0
  ///
  /// Raises invalid_argument for beta <= 0.
  explicit exponential(RealType a = RealType(0), RealType beta = RealType(1));

  ///@{
  /// As given to the constructor.
  RealType a() const { return a_; }
  RealType beta() const { return beta_; }
  ///@}

 private:
  RealType a_;
  RealType beta_;
};

/// How weibull draws: one word, one result.
namespace weibull_method {
/// Inversion.
struct TARN_EXPORT icdf {};
/// Inversion; results never below a.
struct TARN_EXPORT icdf_accurate {};
}  // namespace weibull_method

/// Weibull with `alpha`, displacement `a` and scale `beta`.
template <typename RealType = float, typename Method = weibull_method::icdf>
class TARN_EXPORT weibull {
  static_assert(detail::is_real_result<RealType>, "weibull: the result type is float or double");
  static_assert(detail::is_one_of<Method, weibull_method::icdf, weibull_method::icdf_accurate>,
                "weibull: no such method");

 public:
  ///@{
  /// The argument of the template.
  using result_type = RealType;
  using method_type = Method;
  ///@}

  /// \param alpha  shape, finite and above 0
  /// \param a      displacement, finite: the least value
  /// \param beta   scale, finite and above 0
  ///
  /// Raises nothing: a CPU queue reports other parameters and draws nothing.
  explicit weibull(RealType alpha = RealType(1), RealType a = RealType(0),
                   RealType beta = RealType(1));

  ///@{
  /// As given to the constructor.
  RealType alpha() const { return alpha_; }
  RealType a() const { return a_; }
  RealType beta() const { return beta_; }
  ///@}

 private:
  RealType alpha_;
  RealType a_;
  RealType beta_;
};

namespace detail {
/// What distributions with a location `a` and a scale `b` share.
template <typename RealType, typename Method>
class TARN_EXPORT location_scale {
 public:
  /// The argument of the template.
  using result_type = RealType;
  /// The argument of the template.
  using method_type = Method;

  /// As given to the constructor.
  RealType a() const { return a_; }
  /// As given to the constructor.
  RealType b() const { return b_; }

 protected:
  /// Takes any numbers.
  location_scale(RealType a, RealType b) : a_(a), b_(b) {}

 private:
  RealType a_;
  RealType b_;
};
}  // namespace detail

/// How rayleigh draws: one word, one result.
namespace rayleigh_method {
/// Inversion.
struct TARN_EXPORT icdf {};
/// Inversion; results never below a.
struct TARN_EXPORT icdf_accurate {};
}  // namespace rayleigh_method

/// Rayleigh with displacement `a` and scale `b`.
template <typename RealType = float, typename Method = rayleigh_method::icdf>
class TARN_EXPORT rayleigh : public detail::location_scale<RealType, Method> {
  static_assert(detail::is_real_result<RealType>, "rayleigh: the result type is float or double");
  static_assert(detail::is_one_of<Method, rayleigh_method::icdf, rayleigh_method::icdf_accurate>,
                "rayleigh: no such method");

 public:
  /// \param a  displacement, finite: the least value
  /// \param b  scale, finite and above 0
  ///
  /// Raises nothing: a CPU queue reports other parameters and draws nothing.
  explicit rayleigh(RealType a = RealType(0), RealType b = RealType(1));
};

/// How gumbel draws.
namespace gumbel_method {
/// Inversion: one word, one result.
struct TARN_EXPORT icdf {};
}  // namespace gumbel_method

/// Gumbel with location `a` and scale `b`.
template <typename RealType = float, typename Method = gumbel_method::icdf>
class TARN_EXPORT gumbel : public detail::location_scale<RealType, Method> {
  static_assert(detail::is_real_result<RealType>, "gumbel: the result type is float or double");
  static_assert(detail::is_one_of<Method, gumbel_method::icdf>, "gumbel: no such method");

 public:
  /// \param a  location, finite: the mode
  /// \param b  scale, finite and above 0
  ///
  /// Raises nothing: a CPU queue reports other parameters and draws nothing.
  explicit gumbel(RealType a = RealType(0), RealType b = RealType(1));
};

/// How laplace draws.
namespace laplace_method {
/// Inversion of distance and side: two words, one result.
struct TARN_EXPORT icdf {};
}  // namespace laplace_method

/// Laplace with mean `a` and scale `b`.
template <typename RealType = float, typename Method = laplace_method::icdf>
class TARN_EXPORT laplace : public detail::location_scale<RealType, Method> {
  static_assert(detail::is_real_result<RealType>, "laplace: the result type is float or double");
  static_assert(detail::is_one_of<Method, laplace_method::icdf>, "laplace: no such method");

 public:
  /// \param a  mean, finite
  /// \param b  scale, finite and above 0
  ///
  /// Raises nothing: a CPU queue reports other parameters and draws nothing.
  explicit laplace(RealType a = RealType(0), RealType b = RealType(1));
};

/// How cauchy draws.
namespace cauchy_method {
/// Inversion: one word, one result.
struct TARN_EXPORT icdf {};
}  // namespace cauchy_method

/// Cauchy with median `a` and scale `b`.
template <typename RealType = float, typename Method = cauchy_method::icdf>
class TARN_EXPORT cauchy : public detail::location_scale<RealType, Method> {
  static_assert(detail::is_real_result<RealType>, "cauchy: the result type is float or double");
  static_assert(detail::is_one_of<Method, cauchy_method::icdf>, "cauchy: no such method");

 public:
  /// \param a  median, finite
  /// \param b  scale, finite and above 0
  ///
  /// Raises nothing: a CPU queue reports other parameters and draws nothing.
  explicit cauchy(RealType a = RealType(0), RealType b = RealType(1));
};

}  // namespace kestrel::tarn::rng
