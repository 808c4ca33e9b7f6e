// SPDX-License-Identifier: Apache-2.0
// The raw routines of gamma.
#include "routines/gamma.hpp"

namespace {

using namespace tarn::statistics;

template <class Real>
int gamma(int method, void* stream, int n, Real* r, Real alpha, Real a, Real beta) {
  return routine(method, parameters::accuracy_methods, stream, n, r, [&](const live_stream& s) {
    if (const int bad = parameters::shape_place_scale(alpha, a, beta); bad != parameters::good)
      return -bad;
    const bool accurate = (method & RVX_RNG_METHOD_ACCURACY_FLAG) != 0;
    return draw_gamma(s, n, r, alpha, affine_place<Real>{a, beta}, accurate);
  });
}

}  // namespace

int _rvxsRngGamma(int method, void* stream, int n, float* r, float alpha, float a, float beta) {
  return gamma(method, stream, n, r, alpha, a, beta);
}

int _rvxdRngGamma(int method, void* stream, int n, double* r, double alpha, double a, double beta) {
  return gamma(method, stream, n, r, alpha, a, beta);
}
