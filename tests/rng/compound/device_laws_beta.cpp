// SPDX-License-Identifier: Apache-2.0
// beta on a GPU queue: shapes in each region of its own method. Both below 1, on both sides of the
// line between two methods; one below and one above; both above; and those equal to 1.
#include "device_laws.hpp"

namespace {

using namespace tarn_test;

template <typename Engine>
class beta_laws : public device_laws<Engine> {
 protected:
  template <typename T, typename Method>
  void expect_law(const double (&set)[4]) {
    const auto p = static_cast<T>(set[0]), q = static_cast<T>(set[1]);
    const auto a = static_cast<T>(set[2]), b = static_cast<T>(set[3]);
    constexpr bool exact_range = std::is_same_v<Method, rng::beta_method::cja_accurate>;
    // Where most results lie next to 1, those next to 0 are made by a difference.
    const double off_zero = p > 1 ? set[3] : 0;
    laws::view seen{laws::beta(p, q, a, b),
                    laws::resolution_of<T>(std::fabs(set[2]) + off_zero, exact_range)};
    seen.expected.upper = a + b;  // as the kernel forms it
    this->expect_laws(text_of("beta", sizeof(T), exact_range, p, q, a, b),
                      rng::beta<T, Method>(p, q, a, b), {seen});
  }

  template <typename T>
  void expect_all() {
    const double sets[][4] = {
        {0.5, 0.5, 0, 1},  {0.1, 0.2, 0, 1},  {0.7, 0.53, 0, 1},   // Johnk
        {0.7, 0.55, 0, 1}, {0.9, 0.9, -1, 2}, {0.99, 0.3, 0, 1},   // Atkinson, both below 1
        {0.7, 4, -1, 5},   {0.1, 30, 0, 1},   {0.95, 1.05, 0, 1},  // the first below 1
        {4, 0.7, 0, 1},    {30, 0.1, 0, 1},   {1.05, 0.95, 3, 1},  // the second
        {2, 3, 0, 1},      {3, 2, 1, 0.5},    {1.01, 1.01, 0, 1}, {20, 35, 2, 0.5},  // Cheng
        {1, 1, 0, 1},      {1, 0.3, 0, 1},    {1, 7, -2, 4},      {0.3, 1, 0, 1},   {8, 1, 0, 10}};
    for (const auto& set : sets) {
      expect_law<T, rng::beta_method::cja>(set);
    }
    const double clamped[][4] = {{0.5, 0.5, -1, 3}, {0.9, 0.9, 0.1, 0.3}, {0.7, 4, 0, 1},
                                 {4, 0.7, 0, 1},    {2, 3, 7, 1},         {1, 0.3, -1, 0.7}};
    for (const auto& set : clamped) {
      expect_law<T, rng::beta_method::cja_accurate>(set);
    }
  }
};
TYPED_TEST_SUITE(beta_laws, engines_of_laws, name_of_engine);

TYPED_TEST(beta_laws, hold_in_float) {
  this->template expect_all<float>();
}
TYPED_TEST(beta_laws, hold_in_double) {
  this->template expect_all<double>();
}

TARN_REPORTS_CUDA(beta_laws)

}  // namespace
