// SPDX-License-Identifier: Apache-2.0
// The raw routine of negative_binomial.
#include "distributions/negative_binomial.hpp"

#include <algorithm>
#include <limits>

#include "distributions/one_word.hpp"
#include "routines/routine.hpp"

using namespace tarn::statistics;

// Certain outcomes (p = 1; practically all values too large) take no words.
int _rvxiRngNegbinomial(int method, void* stream, int n, std::int32_t* r, double a, double p) {
  return routine(method, parameters::any_method, stream, n, r, [&](const live_stream& s) {
    if (const int bad = parameters::negative_binomial(a, p); bad != parameters::good)
      return -bad;
    const negative_binomial_law law(a, p);
    const auto count = static_cast<std::size_t>(n);
    if (law.zero())
      std::fill_n(r, count, 0);
    else if (law.saturated())
      std::fill_n(r, count, std::numeric_limits<std::int32_t>::max());
    else if (law.by_table())
      return draw_from(s, n, 1, r, one_word_values{0, invert_negative_binomial(law, count)});
    else if (a < 1)
      draw_under_hat(source_of(s), power_hat(law), count, r);
    else
      draw_under_hat(source_of(s), nbar(law, count), count, r);
    return RVX_STATUS_OK;
  });
}
