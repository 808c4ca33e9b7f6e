// SPDX-License-Identifier: Apache-2.0
// Gamma and its kin, beta and chi-square: parameters only. Of the continuous distributions these
// are the ones drawn by rejection.
#pragma once

#include <cstdint>

#include <kestrel/tarn/export.hpp>
#include <kestrel/tarn/rng/detail/type_list.hpp>

namespace kestrel::tarn::rng {

/// How gamma draws. Marsaglia and Tsang, ACM TOMS 26, 2000, for shapes above 1.
namespace gamma_method {
/// Rejection: the words that a result takes vary.
struct TARN_EXPORT marsaglia {};
/// The same; results never below a.
struct TARN_EXPORT marsaglia_accurate {};
}  // namespace gamma_method

/// Gamma with shape `alpha` > 0, displacement `a` and scale `beta` > 0.
template <typename RealType = float, typename Method = gamma_method::marsaglia>
class TARN_EXPORT gamma {
  static_assert(detail::is_real_result<RealType>, "gamma: the result type is float or double");
  static_assert(
      detail::is_one_of<Method, gamma_method::marsaglia, gamma_method::marsaglia_accurate>,
      "gamma: no such method");

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
  /// Raises invalid_argument for alpha <= 0, for beta <= 0 and for an alpha that is not a number.
  explicit gamma(RealType alpha = RealType(1), RealType a = RealType(0),
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

/// How beta draws, by the shapes: Cheng, Comm. ACM 21, 1978; Johnk, Metrika 8, 1964; Atkinson,
/// Biometrika 66, 1979.
namespace beta_method {
/// Rejection: the words that a result takes vary.
struct TARN_EXPORT cja {};
/// The same; results inside [a, a + b].
struct TARN_EXPORT cja_accurate {};
}  // namespace beta_method

/// Beta with shapes `p` and `q`, displacement `a` and scale `b`: support [a, a + b].
template <typename RealType = float, typename Method = beta_method::cja>
class TARN_EXPORT beta {
  static_assert(detail::is_real_result<RealType>, "beta: the result type is float or double");
  static_assert(detail::is_one_of<Method, beta_method::cja, beta_method::cja_accurate>,
                "beta: no such method");

 public:
  ///@{
  /// The argument of the template.
  using result_type = RealType;
  using method_type = Method;
  ///@}

  /// \param p  shape at a, finite and above 0
  /// \param q  shape at a + b, finite and above 0
  /// \param a  displacement, finite
  /// \param b  scale, finite and above 0
  ///
  /// Raises invalid_argument for p <= 0, q <= 0 and infinite shapes, and `generate` on a GPU queue
  /// for shapes so small or large that next to nothing would be accepted. For a shape that is not a
  /// number a GPU queue draws uniforms; a CPU queue reports it, and other parameters, and draws
  /// nothing.
  explicit beta(RealType p = RealType(1), RealType q = RealType(1), RealType a = RealType(0),
                RealType b = RealType(1));

  ///@{
  /// As given to the constructor.
  RealType p() const { return p_; }
  RealType q() const { return q_; }
  RealType a() const { return a_; }
  RealType b() const { return b_; }
  ///@}

 private:
  RealType p_;
  RealType q_;
  RealType a_;
  RealType b_;
};

/// How chi_square draws.
namespace chi_square_method {
/// By normals, uniforms or a gamma number, as n is.
struct TARN_EXPORT gamma_based {};
}  // namespace chi_square_method

/// Chi-square with `n` >= 1 degrees of freedom.
template <typename RealType = float, typename Method = chi_square_method::gamma_based>
class TARN_EXPORT chi_square {
  static_assert(detail::is_real_result<RealType>, "chi_square: the result type is float or double");
  static_assert(detail::is_one_of<Method, chi_square_method::gamma_based>,
                "chi_square: no such method");

 public:
  ///@{
  /// The argument of the template.
  using result_type = RealType;
  using method_type = Method;
  ///@}

  /// \param n  degrees of freedom, 1 or more
  ///
  /// Raises invalid_argument for n < 1.
  explicit chi_square(std::int32_t n = 1);

  ///@{
  /// As given to the constructor.
  std::int32_t n() const { return n_; }
  ///@}

 private:
  std::int32_t n_;
};

}  // namespace kestrel::tarn::rng
