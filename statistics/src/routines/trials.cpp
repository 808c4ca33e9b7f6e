// SPDX-License-Identifier: Apache-2.0
// The raw routines of bernoulli and geometric.
#include "distributions/trials.hpp"

#include "distributions/one_word.hpp"
#include "routines/routine.hpp"

using namespace tarn::statistics;

int _rvxiRngBernoulli(int method, void* stream, int n, std::int32_t* r, double p) {
  return routine(method, parameters::any_method, stream, n, r, [&](const live_stream& s) {
    if (const int bad = parameters::bernoulli(p); bad != parameters::good)
      return -bad;
    return draw_from(s, n, 1, r,
                     one_word_values{0, [&](const double* u, std::size_t count, std::int32_t* to) {
                                       bernoulli(u, count, p, to);
                                     }});
  });
}

int _rvxiRngGeometric(int method, void* stream, int n, std::int32_t* r, double p) {
  return routine(method, parameters::any_method, stream, n, r, [&](const live_stream& s) {
    if (const int bad = parameters::geometric(p); bad != parameters::good)
      return -bad;
    const geometric_law law(p);
    return draw_from(s, n, 1, r,
                     one_word_values{0, [&](const double* u, std::size_t count, std::int32_t* to) {
                                       geometric(u, count, law, to);
                                     }});
  });
}
