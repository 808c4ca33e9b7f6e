// SPDX-License-Identifier: Apache-2.0
// The raw routines of chi_square.
#include "distributions/chi_square.hpp"

#include "routines/gamma.hpp"

namespace {

using namespace tarn::statistics;

constexpr std::int32_t most_degrees_by_products = 16;

template <class Real>
int chi_square(int method, void* stream, int n, Real* r, std::int32_t degrees) {
  return routine(method, parameters::any_method, stream, n, r, [&](const live_stream& s) {
    if (const int bad = parameters::chi_square(degrees); bad != parameters::good)
      return -bad;
    const auto count = static_cast<std::size_t>(degrees);
    if (degrees == 1 || degrees == 3)
      return draw_from(s, n, count, r, sums_of_squares<Real>{count});
    if (degrees % 2 == 0 && degrees <= most_degrees_by_products)
      return draw_from(s, n, count / 2, r, logs_of_products<Real>{count / 2});
    return draw_gamma(s, n, r, static_cast<Real>(degrees) / 2, affine_place<Real>{0, 2}, false);
  });
}

}  // namespace

int _rvxsRngChiSquare(int method, void* stream, int n, float* r, std::int32_t degrees) {
  return chi_square(method, stream, n, r, degrees);
}

int _rvxdRngChiSquare(int method, void* stream, int n, double* r, std::int32_t degrees) {
  return chi_square(method, stream, n, r, degrees);
}
