// SPDX-License-Identifier: Apache-2.0
// The raw routine of hypergeometric.
#include "distributions/hypergeometric.hpp"

#include <algorithm>

#include "distributions/one_word.hpp"
#include "routines/routine.hpp"

using namespace tarn::statistics;

// Certain outcomes (nothing or everything is marked or drawn) take no words.
int _rvxiRngHypergeometric(int method, void* stream, int n, std::int32_t* r, std::int32_t l,
                           std::int32_t s, std::int32_t m) {
  return routine(method, parameters::any_method, stream, n, r, [&](const live_stream& live) {
    if (const int bad = parameters::hypergeometric(l, s, m); bad != parameters::good)
      return -bad;
    const hypergeometric_law law(l, s, m);
    const auto count = static_cast<std::size_t>(n);
    if (law.constant())
      std::fill_n(r, count, law.origin);
    else if (law.by_table())
      return draw_from(live, n, 1, r, one_word_values{0, invert_hypergeometric(law, count)});
    else
      draw_under_hat(source_of(live), h2pe(law, count), count, r);
    return RVX_STATUS_OK;
  });
}
