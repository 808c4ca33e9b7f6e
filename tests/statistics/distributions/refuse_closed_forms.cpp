// SPDX-License-Identifier: Apache-2.0
// The raw routines of the normal family and the other closed formulas refuse methods and parameters
// that they cannot have, write nothing, and leave the stream alone.
#include <functional>
#include <limits>

#include "support.hpp"

namespace {

using closed_form_routines = testing::Test;

template <class Real>
using call = std::function<int(void* stream, Real* r)>;

template <class Real>
void expect_refused(int status, const call<Real>& draw) {
  support::stream s(3);
  const plain::stream before = s.position();
  support::results<Real> r(5);
  EXPECT_EQ(draw(static_cast<rvx_stream>(s), r.data()), status);
  EXPECT_TRUE(r.untouched());
  EXPECT_TRUE(support::same_position(s, before));
}

template <class Real, class Routine>
void expect_place_and_scale_refused(Routine routine) {
  constexpr Real infinite = std::numeric_limits<Real>::infinity();
  constexpr Real no_number = std::numeric_limits<Real>::quiet_NaN();
  for (const Real place : {infinite, -infinite, no_number})
    expect_refused<Real>(-5, [&](void* s, Real* r) { return routine(0, s, 5, r, place, Real(1)); });
  for (const Real scale : {Real(0), Real(-1), infinite, no_number})
    expect_refused<Real>(-6, [&](void* s, Real* r) { return routine(0, s, 5, r, Real(0), scale); });
  expect_refused<Real>(-1,
                       [&](void* s, Real* r) { return routine(-1, s, 5, r, Real(0), Real(1)); });
}

TEST_F(closed_form_routines, places_and_scales) {
  expect_place_and_scale_refused<float>(_rvxsRngGaussian);
  expect_place_and_scale_refused<double>(_rvxdRngGaussian);
  expect_place_and_scale_refused<float>(_rvxsRngExponential);
  expect_place_and_scale_refused<double>(_rvxdRngExponential);
  expect_place_and_scale_refused<float>(_rvxsRngRayleigh);
  expect_place_and_scale_refused<double>(_rvxdRngRayleigh);
  expect_place_and_scale_refused<float>(_rvxsRngGumbel);
  expect_place_and_scale_refused<double>(_rvxdRngGumbel);
  expect_place_and_scale_refused<float>(_rvxsRngLaplace);
  expect_place_and_scale_refused<double>(_rvxdRngLaplace);
  expect_place_and_scale_refused<float>(_rvxsRngCauchy);
  expect_place_and_scale_refused<double>(_rvxdRngCauchy);
}

TEST_F(closed_form_routines, parameters_of_weibull_and_lognormal) {
  for (int bad = 0; bad < 3; ++bad) {
    double p[3] = {1, 1, 1};
    p[bad] = bad == 1 ? std::numeric_limits<double>::infinity() : 0;
    expect_refused<double>(-5 - bad, [&](void* s, double* r) {
      return _rvxdRngWeibull(0, s, 5, r, p[0], p[1], p[2]);
    });
  }
  for (int bad = 0; bad < 4; ++bad) {
    float p[4] = {1, 1, 1, 1};
    p[bad] = bad % 2 == 0 ? std::numeric_limits<float>::infinity() : 0;
    expect_refused<float>(-5 - bad, [&](void* s, float* r) {
      return _rvxsRngLognormal(0, s, 5, r, p[0], p[1], p[2], p[3]);
    });
  }
}

TEST_F(closed_form_routines, methods) {
  for (const int method : {3, 4, 0x40000000})
    expect_refused<float>(
        -1, [&](void* s, float* r) { return _rvxsRngGaussian(method, s, 5, r, 0, 1); });
  for (const int method : {2, 0x40000002})
    expect_refused<double>(
        -1, [&](void* s, double* r) { return _rvxdRngLognormal(method, s, 5, r, 0, 1, 0, 1); });
  expect_refused<float>(-1,
                        [](void* s, float* r) { return _rvxsRngExponential(1, s, 5, r, 0, 1); });
  expect_refused<float>(-1, [](void* s, float* r) { return _rvxsRngRayleigh(1, s, 5, r, 0, 1); });
  expect_refused<float>(-1, [](void* s, float* r) { return _rvxsRngWeibull(1, s, 5, r, 1, 0, 1); });
}

}  // namespace
