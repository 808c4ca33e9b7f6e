// SPDX-License-Identifier: Apache-2.0
// The raw routines of the distributions whose inverse is a closed formula.
#include "distributions/exponential.hpp"
#include "routines/routine.hpp"

namespace {

using namespace tarn::statistics;

bool accurate(int method) {
  return (method & RVX_RNG_METHOD_ACCURACY_FLAG) != 0;
}

// Distributions of a place and a scale alone.
template <class Real, class Producer>
int placed_values(int method, int methods, void* stream, int n, std::size_t words_per_value,
                  Real* r, const Producer& producer) {
  return routine(method, methods, stream, n, r, [&](const live_stream& s) {
    const int bad = parameters::place_and_scale(producer.place, producer.scale);
    return bad != parameters::good ? -bad : draw_from(s, n, words_per_value, r, producer);
  });
}

template <class Real>
int weibull_values(int method, void* stream, int n, Real* r, const weibull<Real>& producer) {
  return routine(method, parameters::accuracy_methods, stream, n, r, [&](const live_stream& s) {
    const int bad = parameters::shape_place_scale(producer.shape, producer.place, producer.scale);
    return bad != parameters::good ? -bad : draw_from(s, n, 1, r, producer);
  });
}

}  // namespace

int _rvxsRngExponential(int method, void* stream, int n, float* r, float a, float beta) {
  return placed_values(method, parameters::accuracy_methods, stream, n, 1, r,
                       exponential<float>{a, beta, accurate(method)});
}

int _rvxdRngExponential(int method, void* stream, int n, double* r, double a, double beta) {
  return placed_values(method, parameters::accuracy_methods, stream, n, 1, r,
                       exponential<double>{a, beta, accurate(method)});
}

int _rvxsRngRayleigh(int method, void* stream, int n, float* r, float a, float b) {
  return placed_values(method, parameters::accuracy_methods, stream, n, 1, r,
                       rayleigh<float>{a, b, accurate(method)});
}

int _rvxdRngRayleigh(int method, void* stream, int n, double* r, double a, double b) {
  return placed_values(method, parameters::accuracy_methods, stream, n, 1, r,
                       rayleigh<double>{a, b, accurate(method)});
}

int _rvxsRngGumbel(int method, void* stream, int n, float* r, float a, float b) {
  return placed_values(method, parameters::any_method, stream, n, 1, r, gumbel<float>{a, b});
}

int _rvxdRngGumbel(int method, void* stream, int n, double* r, double a, double b) {
  return placed_values(method, parameters::any_method, stream, n, 1, r, gumbel<double>{a, b});
}

int _rvxsRngCauchy(int method, void* stream, int n, float* r, float a, float b) {
  return placed_values(method, parameters::any_method, stream, n, 1, r, cauchy<float>{a, b});
}

int _rvxdRngCauchy(int method, void* stream, int n, double* r, double a, double b) {
  return placed_values(method, parameters::any_method, stream, n, 1, r, cauchy<double>{a, b});
}

int _rvxsRngLaplace(int method, void* stream, int n, float* r, float a, float b) {
  return placed_values(method, parameters::any_method, stream, n, 2, r, laplace<float>{a, b});
}

int _rvxdRngLaplace(int method, void* stream, int n, double* r, double a, double b) {
  return placed_values(method, parameters::any_method, stream, n, 2, r, laplace<double>{a, b});
}

int _rvxsRngWeibull(int method, void* stream, int n, float* r, float alpha, float a, float beta) {
  return weibull_values(method, stream, n, r, weibull<float>{alpha, a, beta, accurate(method)});
}

int _rvxdRngWeibull(int method, void* stream, int n, double* r, double alpha, double a,
                    double beta) {
  return weibull_values(method, stream, n, r, weibull<double>{alpha, a, beta, accurate(method)});
}
