// SPDX-License-Identifier: Apache-2.0
// The raw routines of poisson and poisson_v.
#include "distributions/poisson.hpp"

#include <algorithm>

#include "distributions/one_word.hpp"
#include "distributions/ptpe.hpp"
#include "routines/routine.hpp"

namespace {

using namespace tarn::statistics;

int from_table(const live_stream& s, int n, std::int32_t* r, double lambda) {
  const auto uses = static_cast<std::size_t>(n);
  if (uses < worth_poisson_table)
    return draw_from(s, n, 1, r,
                     one_word_values{0, [&](const double* u, std::size_t count, std::int32_t* to) {
                                       poisson_by_steps(u, count, lambda, to);
                                     }});
  const guide_table table = poisson_table(lambda, uses);
  return draw_from(s, n, 1, r,
                   one_word_values{0, [&](const double* u, std::size_t count, std::int32_t* to) {
                                     table.look_up(u, count, to);
                                   }});
}

int by_normal(const live_stream& s, int n, std::int32_t* r, double lambda) {
  const poisson_quantiles values(lambda, static_cast<std::size_t>(n));
  return draw_from(s, n, 1, r,
                   one_word_values{-1, [&](const double* u, std::size_t count, std::int32_t* to) {
                                     values(u, count, to);
                                   }});
}

int by_rejection(const live_stream& s, int n, std::int32_t* r, double lambda) {
  const auto count = static_cast<std::size_t>(n);
  draw_under_hat(source_of(s), ptpe(lambda, count), count, r);
  return RVX_STATUS_OK;
}

}  // namespace

int _rvxiRngPoisson(int method, void* stream, int n, std::int32_t* r, double lambda) {
  return routine(method, RVX_RNG_METHOD_POISSON_GAUSSIAN_ICDF, stream, n, r,
                 [&](const live_stream& s) {
                   if (const int bad = parameters::poisson(lambda); bad != parameters::good)
                     return -bad;
                   if (lambda < table_rates)
                     return from_table(s, n, r, lambda);
                   return method == RVX_RNG_METHOD_POISSON_PTPE ? by_rejection(s, n, r, lambda)
                                                                : by_normal(s, n, r, lambda);
                 });
}

int _rvxiRngPoissonV(int method, void* stream, int n, std::int32_t* r, const double* lambda) {
  return routine(method, parameters::any_method, stream, n, r, [&](const live_stream& s) {
    if (const int bad = parameters::poisson_v(lambda); bad != parameters::good)
      return -bad;
    if (!std::all_of(lambda, lambda + n, parameters::positive<double>))
      return -5;
    return draw_from(s, n, 1, r,
                     one_word_values{-1, [&](const double* u, std::size_t count, std::int32_t* to) {
                                       poisson_v_by_normal(u, count, lambda + (to - r), to);
                                     }});
  });
}
