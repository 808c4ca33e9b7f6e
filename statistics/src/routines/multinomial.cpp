// SPDX-License-Identifier: Apache-2.0
// The raw routine of multinomial.
#include "distributions/multinomial.hpp"

#include <algorithm>

#include "routines/rows.hpp"

using namespace tarn::statistics;

// Certain outcomes (no trials, one category) take no words.
int _rvxiRngMultinomial(int method, void* stream, int n, std::int32_t* r, std::int32_t ntrial,
                        std::int32_t categories, const double* p) {
  return routine(method, parameters::any_method, stream, n, r, [&](const live_stream& s) {
    if (const int bad = parameters::multinomial(ntrial, categories, p); bad != parameters::good)
      return -bad;
    const auto width = static_cast<std::size_t>(categories), rows = static_cast<std::size_t>(n);
    if (!is_law(p, width))
      return -7;
    if (ntrial == 0 || categories == 1) {
      std::fill_n(r, rows * width, ntrial);
      return RVX_STATUS_OK;
    }
    if (ntrial / trials_per_binomial > categories) {
      conditional_counts(ntrial, p, width)(source_of(s), rows, r);
      return RVX_STATUS_OK;
    }
    const auto trials = static_cast<std::size_t>(ntrial);
    const counted_trials counts(trials, p, width, rows);
    if (!has_words(s, rows * trials))
      return RVX_STATUS_END_OF_SEQUENCE;
    draw_rows(source_of(s), rows, trials, r,
              [&](const word_source& source, std::size_t first, std::size_t count) {
                counts(source, count, r + first * width);
              });
    return RVX_STATUS_OK;
  });
}
