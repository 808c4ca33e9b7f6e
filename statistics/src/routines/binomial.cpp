// SPDX-License-Identifier: Apache-2.0
// The raw routine of binomial.
#include "distributions/binomial.hpp"

#include <algorithm>

#include "distributions/one_word.hpp"
#include "routines/routine.hpp"

using namespace tarn::statistics;

// Certain outcomes (p = 0 or 1) take no words.
int _rvxiRngBinomial(int method, void* stream, int n, std::int32_t* r, std::int32_t ntrial,
                     double p) {
  return routine(method, parameters::any_method, stream, n, r, [&](const live_stream& s) {
    if (const int bad = parameters::binomial(ntrial, p); bad != parameters::good)
      return -bad;
    const binomial_law law(ntrial, p);
    const auto count = static_cast<std::size_t>(n);
    if (law.constant())
      std::fill_n(r, count, law.flipped ? ntrial : 0);
    else if (law.by_table())
      return draw_from(s, n, 1, r, one_word_values{0, invert_binomial(law, count)});
    else
      draw_under_hat(source_of(s), btpe(law, count), count, r);
    return RVX_STATUS_OK;
  });
}
