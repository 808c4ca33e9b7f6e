// SPDX-License-Identifier: Apache-2.0
// The raw routines of beta.
#include "distributions/beta.hpp"

#include "routines/routine.hpp"

namespace {

using namespace tarn::statistics;

template <class Real, class Method>
int by_rejection(const live_stream& s, int n, Real* r, const Method& method,
                 const affine_place<Real>& where) {
  draw_by_rejection(source_of(s), static_cast<std::size_t>(n), method, where, r);
  return RVX_STATUS_OK;
}

// Words: one a value where a shape is 1, else two for each candidate.
template <class Real>
int draw_beta(const live_stream& s, int n, Real* r, Real p, Real q,
              const affine_place<Real>& where) {
  if (p == 1 || q == 1) {
    const bool complement = p == 1;
    return draw_from(s, n, 1, r, beta_by_inversion<Real>{complement ? q : p, complement, where});
  }
  if (p > 1 && q > 1)
    return by_rejection(s, n, r, cheng_bb(p, q), where);
  if (p < 1 && q < 1 && prefers_johnk(p, q))
    return by_rejection(s, n, r, johnk(p, q), where);
  return by_rejection(s, n, r, atkinson(p, q), where);
}

// Results of both methods lie in [a, a + b] as rounded (affine_place).
template <class Real>
int beta(int method, void* stream, int n, Real* r, Real p, Real q, Real a, Real b) {
  return routine(method, parameters::accuracy_methods, stream, n, r, [&](const live_stream& s) {
    if (const int bad = parameters::beta(p, q, a, b); bad != parameters::good)
      return -bad;
    return draw_beta(s, n, r, p, q, affine_place<Real>{a, b});
  });
}

}  // namespace

int _rvxsRngBeta(int method, void* stream, int n, float* r, float p, float q, float a, float b) {
  return beta(method, stream, n, r, p, q, a, b);
}

int _rvxdRngBeta(int method, void* stream, int n, double* r, double p, double q, double a,
                 double b) {
  return beta(method, stream, n, r, p, q, a, b);
}
