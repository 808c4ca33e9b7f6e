// SPDX-License-Identifier: Apache-2.0
// The raw routines of uniform.
#include "distributions/uniform.hpp"

#include "routines/routine.hpp"

namespace {

using namespace tarn::statistics;

template <class Real>
int uniform(int method, void* stream, int n, Real* r, Real a, Real b) {
  return routine(method, parameters::accuracy_methods, stream, n, r, [&](const live_stream& s) {
    if (const int bad = parameters::uniform(a, b); bad != parameters::good)
      return -bad;
    const bool accurate = (method & RVX_RNG_METHOD_ACCURACY_FLAG) != 0;
    return draw_from(s, n, 1, r, uniform_real<Real>{a, b, accurate});
  });
}

}  // namespace

int _rvxsRngUniform(int method, void* stream, int n, float* r, float a, float b) {
  return uniform(method, stream, n, r, a, b);
}

int _rvxdRngUniform(int method, void* stream, int n, double* r, double a, double b) {
  return uniform(method, stream, n, r, a, b);
}

int _rvxiRngUniform(int method, void* stream, int n, std::int32_t* r, std::int32_t a,
                    std::int32_t b) {
  return routine(method, parameters::any_method, stream, n, r, [&](const live_stream& s) {
    if (const int bad = parameters::uniform(a, b); bad != parameters::good)
      return -bad;
    return draw_from(s, n, 1, r, uniform_int32{a, b});
  });
}
