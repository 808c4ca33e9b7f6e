// SPDX-License-Identifier: Apache-2.0
// The raw routines of gaussian and lognormal.
#include "routines/normal.hpp"

namespace {

using namespace tarn::statistics;

template <class Real>
int gaussian(int method, void* stream, int n, Real* r, Real mean, Real stddev) {
  return routine(method, parameters::gaussian_methods, stream, n, r, [&](const live_stream& s) {
    if (const int bad = parameters::place_and_scale(mean, stddev); bad != parameters::good)
      return -bad;
    return draw_gaussian(method, s, n, r, mean, stddev);
  });
}

template <class Real>
int lognormal(int method, void* stream, int n, Real* r, Real m, Real s, Real displ, Real scale) {
  const auto use = [&](const live_stream& live) {
    if (const int bad = parameters::lognormal(m, s, displ, scale); bad != parameters::good)
      return -bad;
    const bool accurate = (method & RVX_RNG_METHOD_ACCURACY_FLAG) != 0;
    const normal_end<Real> end = lognormal_end(m, s, displ, scale, accurate);
    if ((method & RVX_RNG_METHOD_LOGNORMAL_ICDF) != 0)
      return draw_from(live, n, 1, r, normal_inversion<Real>{end});
    return draw_from(live, n, 1, r, box_muller2<Real>{end});
  };
  return routine(method, parameters::lognormal_methods, stream, n, r, use);
}

}  // namespace

int _rvxsRngGaussian(int method, void* stream, int n, float* r, float mean, float stddev) {
  return gaussian(method, stream, n, r, mean, stddev);
}

int _rvxdRngGaussian(int method, void* stream, int n, double* r, double mean, double stddev) {
  return gaussian(method, stream, n, r, mean, stddev);
}

int _rvxsRngLognormal(int method, void* stream, int n, float* r, float m, float s, float displ,
                      float scale) {
  return lognormal(method, stream, n, r, m, s, displ, scale);
}

int _rvxdRngLognormal(int method, void* stream, int n, double* r, double m, double s, double displ,
                      double scale) {
  return lognormal(method, stream, n, r, m, s, displ, scale);
}
