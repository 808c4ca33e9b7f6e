// SPDX-License-Identifier: Apache-2.0
// Continuous distributions: parameters only. Drawing is in generate.hpp; every class keeps the
// values given at construction and refuses those outside their ranges with invalid_argument.
#pragma once

#include <cstdint>
#include <limits>
#include <vector>

#include <kestrel/tarn/export.hpp>
#include <kestrel/tarn/rng/detail/type_list.hpp>

namespace kestrel::tarn::rng {

namespace uniform_method {
struct TARN_EXPORT standard {};  // rounding may deliver the upper bound
struct TARN_EXPORT accurate {};  // reals clamped to [a, b]; integers drawn in double precision
}  // namespace uniform_method

namespace detail {
/// Upper bound of a default uniform: 1 for reals, the largest value for integers.
template <typename Type>
inline constexpr Type default_upper_bound = is_real_result<Type> ? Type(1)
                                                                 : std::numeric_limits<Type>::max();
}  // namespace detail

/// Uniform on [a, b); for integers the floor of a real uniform on [a, b). a < b is expected: a CPU
/// queue reports anything else and draws nothing.
template <typename Type = float, typename Method = uniform_method::standard>
class TARN_EXPORT uniform {
  static_assert(detail::is_real_result<Type> || detail::is_integer_result<Type>,
                "uniform: the result type is float, double, std::int32_t or std::uint32_t");
  static_assert(detail::is_one_of<Method, uniform_method::standard, uniform_method::accurate>,
                "uniform: no such method");

 public:
  using result_type = Type;
  using method_type = Method;

  explicit uniform(Type a = Type(0), Type b = detail::default_upper_bound<Type>);

  Type a() const { return a_; }
  Type b() const { return b_; }

 private:
  Type a_;
  Type b_;
};

namespace gaussian_method {
struct TARN_EXPORT box_muller {};   // two words, one result
struct TARN_EXPORT box_muller2 {};  // two words, two results
struct TARN_EXPORT icdf {};         // one word, one result
}  // namespace gaussian_method

/// Normal with mean `mean` and standard deviation `stddev`.
template <typename RealType = float, typename Method = gaussian_method::box_muller2>
class TARN_EXPORT gaussian {
  static_assert(detail::is_real_result<RealType>, "gaussian: the result type is float or double");
  static_assert(detail::is_one_of<Method, gaussian_method::box_muller, gaussian_method::box_muller2,
                                  gaussian_method::icdf>,
                "gaussian: no such method");

 public:
  using result_type = RealType;
  using method_type = Method;

  explicit gaussian(RealType mean = RealType(0), RealType stddev = RealType(1));

  RealType mean() const { return mean_; }
  RealType stddev() const { return stddev_; }

 private:
  RealType mean_;
  RealType stddev_;
};

namespace lognormal_method {
struct TARN_EXPORT box_muller2 {};
struct TARN_EXPORT box_muller2_accurate {};
struct TARN_EXPORT icdf {};
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
  using result_type = RealType;
  using method_type = Method;

  explicit lognormal(RealType m = RealType(0), RealType s = RealType(1),
                     RealType displ = RealType(0), RealType scale = RealType(1));

  RealType m() const { return m_; }
  RealType s() const { return s_; }
  RealType displ() const { return displ_; }
  RealType scale() const { return scale_; }

 private:
  RealType m_;
  RealType s_;
  RealType displ_;
  RealType scale_;
};

namespace exponential_method {
struct TARN_EXPORT icdf {};
struct TARN_EXPORT icdf_accurate {};  // results never below a
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
  using result_type = RealType;
  using method_type = Method;

  explicit exponential(RealType a = RealType(0), RealType beta = RealType(1));

  RealType a() const { return a_; }
  RealType beta() const { return beta_; }

 private:
  RealType a_;
  RealType beta_;
};

namespace gamma_method {
struct TARN_EXPORT marsaglia {};
struct TARN_EXPORT marsaglia_accurate {};  // results never below a
}  // namespace gamma_method

/// Gamma with shape `alpha` > 0, displacement `a` and scale `beta` > 0.
template <typename RealType = float, typename Method = gamma_method::marsaglia>
class TARN_EXPORT gamma {
  static_assert(detail::is_real_result<RealType>, "gamma: the result type is float or double");
  static_assert(
      detail::is_one_of<Method, gamma_method::marsaglia, gamma_method::marsaglia_accurate>,
      "gamma: no such method");

 public:
  using result_type = RealType;
  using method_type = Method;

  explicit gamma(RealType alpha = RealType(1), RealType a = RealType(0),
                 RealType beta = RealType(1));

  RealType alpha() const { return alpha_; }
  RealType a() const { return a_; }
  RealType beta() const { return beta_; }

 private:
  RealType alpha_;
  RealType a_;
  RealType beta_;
};

namespace beta_method {
struct TARN_EXPORT cja {};
struct TARN_EXPORT cja_accurate {};  // results inside [a, a + b]
}  // namespace beta_method

/// Beta with shapes `p` and `q`, displacement `a` and scale `b`: support [a, a + b].
template <typename RealType = float, typename Method = beta_method::cja>
class TARN_EXPORT beta {
  static_assert(detail::is_real_result<RealType>, "beta: the result type is float or double");
  static_assert(detail::is_one_of<Method, beta_method::cja, beta_method::cja_accurate>,
                "beta: no such method");

 public:
  using result_type = RealType;
  using method_type = Method;

  explicit beta(RealType p = RealType(1), RealType q = RealType(1), RealType a = RealType(0),
                RealType b = RealType(1));

  RealType p() const { return p_; }
  RealType q() const { return q_; }
  RealType a() const { return a_; }
  RealType b() const { return b_; }

 private:
  RealType p_;
  RealType q_;
  RealType a_;
  RealType b_;
};

namespace chi_square_method {
struct TARN_EXPORT gamma_based {};
}  // namespace chi_square_method

/// Chi-square with `n` >= 1 degrees of freedom.
template <typename RealType = float, typename Method = chi_square_method::gamma_based>
class TARN_EXPORT chi_square {
  static_assert(detail::is_real_result<RealType>, "chi_square: the result type is float or double");
  static_assert(detail::is_one_of<Method, chi_square_method::gamma_based>,
                "chi_square: no such method");

 public:
  using result_type = RealType;
  using method_type = Method;

  explicit chi_square(std::int32_t n = 1);

  std::int32_t n() const { return n_; }

 private:
  std::int32_t n_;
};

namespace weibull_method {
struct TARN_EXPORT icdf {};
struct TARN_EXPORT icdf_accurate {};  // results never below a
}  // namespace weibull_method

/// Weibull with `alpha`, displacement `a` and scale `beta`.
template <typename RealType = float, typename Method = weibull_method::icdf>
class TARN_EXPORT weibull {
  static_assert(detail::is_real_result<RealType>, "weibull: the result type is float or double");
  static_assert(detail::is_one_of<Method, weibull_method::icdf, weibull_method::icdf_accurate>,
                "weibull: no such method");

 public:
  using result_type = RealType;
  using method_type = Method;

  explicit weibull(RealType alpha = RealType(1), RealType a = RealType(0),
                   RealType beta = RealType(1));

  RealType alpha() const { return alpha_; }
  RealType a() const { return a_; }
  RealType beta() const { return beta_; }

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
  using result_type = RealType;
  using method_type = Method;

  RealType a() const { return a_; }
  RealType b() const { return b_; }

 protected:
  location_scale(RealType a, RealType b) : a_(a), b_(b) {}

 private:
  RealType a_;
  RealType b_;
};
}  // namespace detail

namespace rayleigh_method {
struct TARN_EXPORT icdf {};
struct TARN_EXPORT icdf_accurate {};  // results never below a
}  // namespace rayleigh_method

/// Rayleigh with displacement `a` and scale `b`.
template <typename RealType = float, typename Method = rayleigh_method::icdf>
class TARN_EXPORT rayleigh : public detail::location_scale<RealType, Method> {
  static_assert(detail::is_real_result<RealType>, "rayleigh: the result type is float or double");
  static_assert(detail::is_one_of<Method, rayleigh_method::icdf, rayleigh_method::icdf_accurate>,
                "rayleigh: no such method");

 public:
  explicit rayleigh(RealType a = RealType(0), RealType b = RealType(1));
};

namespace gumbel_method {
struct TARN_EXPORT icdf {};
}  // namespace gumbel_method

/// Gumbel with location `a` and scale `b`.
template <typename RealType = float, typename Method = gumbel_method::icdf>
class TARN_EXPORT gumbel : public detail::location_scale<RealType, Method> {
  static_assert(detail::is_real_result<RealType>, "gumbel: the result type is float or double");
  static_assert(detail::is_one_of<Method, gumbel_method::icdf>, "gumbel: no such method");

 public:
  explicit gumbel(RealType a = RealType(0), RealType b = RealType(1));
};

namespace laplace_method {
struct TARN_EXPORT icdf {};
}  // namespace laplace_method

/// Laplace with mean `a` and scale `b`.
template <typename RealType = float, typename Method = laplace_method::icdf>
class TARN_EXPORT laplace : public detail::location_scale<RealType, Method> {
  static_assert(detail::is_real_result<RealType>, "laplace: the result type is float or double");
  static_assert(detail::is_one_of<Method, laplace_method::icdf>, "laplace: no such method");

 public:
  explicit laplace(RealType a = RealType(0), RealType b = RealType(1));
};

namespace cauchy_method {
struct TARN_EXPORT icdf {};
}  // namespace cauchy_method

/// Cauchy with median `a` and scale `b`.
template <typename RealType = float, typename Method = cauchy_method::icdf>
class TARN_EXPORT cauchy : public detail::location_scale<RealType, Method> {
  static_assert(detail::is_real_result<RealType>, "cauchy: the result type is float or double");
  static_assert(detail::is_one_of<Method, cauchy_method::icdf>, "cauchy: no such method");

 public:
  explicit cauchy(RealType a = RealType(0), RealType b = RealType(1));
};

}  // namespace kestrel::tarn::rng
