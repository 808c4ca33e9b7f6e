// SPDX-License-Identifier: Apache-2.0
// gamma and chi_square on a GPU queue: shapes on both sides of 0.6 and of 1, where the methods
// change, and degrees on both sides of every change of method: 1 and 3, even ones up to 16, others.
#include "device_laws.hpp"

namespace {

using namespace tarn_test;

template <typename Engine>
class gamma_laws : public device_laws<Engine> {
 protected:
  template <typename T, typename Method>
  void expect_law_of_gamma(double shape, double place, double scale) {
    const auto alpha = static_cast<T>(shape), a = static_cast<T>(place);
    const auto beta = static_cast<T>(scale);
    constexpr bool exact_range = std::is_same_v<Method, rng::gamma_method::marsaglia_accurate>;
    // The cube of 1 + k x is off by the last place of 1, however small it is.
    const double off_zero = alpha > 1 ? scale : 0;
    this->expect_laws(text_of("gamma", sizeof(T), exact_range, alpha, a, beta),
                      rng::gamma<T, Method>(alpha, a, beta),
                      {{laws::gamma(alpha, a, beta),
                        laws::resolution_of<T>(std::fabs(place) + off_zero, exact_range)}});
  }

  template <typename T>
  void expect_laws_of_gamma() {
    using standard = rng::gamma_method::marsaglia;
    using accurate = rng::gamma_method::marsaglia_accurate;
    for (const double shape : {0.1, 0.5, 0.6, 0.601, 0.7, 0.99, 1.0, 1.001, 2.5, 50.0}) {
      expect_law_of_gamma<T, standard>(shape, 0, 1);
    }
    for (const double shape : {0.5, 0.7, 1.0, 2.5}) {
      expect_law_of_gamma<T, accurate>(shape, 1.5, 2);
    }
    expect_law_of_gamma<T, standard>(2.5, -3, 0.25);
  }

  template <typename T>
  void expect_laws_of_chi_square() {
    for (const std::int32_t degrees : {1, 2, 3, 4, 5, 15, 16, 17, 18, 101}) {
      this->expect_laws(text_of("chi_square", sizeof(T), degrees), rng::chi_square<T>(degrees),
                        {{laws::chi_square(degrees), laws::resolution_of<T>(degrees > 2 ? 2 : 0)}});
    }
  }
};
TYPED_TEST_SUITE(gamma_laws, engines_of_laws, name_of_engine);
TARN_REPORTS_CUDA(gamma_laws)

TYPED_TEST(gamma_laws, of_gamma_hold_in_float) {
  this->template expect_laws_of_gamma<float>();
}
TYPED_TEST(gamma_laws, of_gamma_hold_in_double) {
  this->template expect_laws_of_gamma<double>();
}
TYPED_TEST(gamma_laws, of_chi_square_hold_in_float) {
  this->template expect_laws_of_chi_square<float>();
}
TYPED_TEST(gamma_laws, of_chi_square_hold_in_double) {
  this->template expect_laws_of_chi_square<double>();
}

}  // namespace
