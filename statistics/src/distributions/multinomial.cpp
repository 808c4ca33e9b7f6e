// SPDX-License-Identifier: Apache-2.0
// Rows of multinomial counts.
#include "distributions/multinomial.hpp"

#include <algorithm>
#include <cmath>

#include "distributions/binomial.hpp"
#include "distributions/canonical.hpp"
#include "distributions/hat.hpp"

namespace tarn::statistics {

namespace {

// In long double, so that only the roundings of the caller's numbers count.
long double sum(const double* p, std::size_t categories) {
  long double total = 0;
  for (std::size_t j = 0; j < categories; ++j)
    total += p[j];
  return total;
}

// Ends with 1 from the last category on that can come: none behind it does.
std::vector<double> cdf_of(const double* p, std::size_t categories) {
  const long double total = sum(p, categories);
  std::vector<double> cdf(categories);
  long double reached = 0;
  std::size_t last = 0;
  for (std::size_t j = 0; j < categories; ++j) {
    reached += p[j];
    cdf[j] = static_cast<double>(reached / total);
    if (p[j] > 0)
      last = j;
  }
  std::fill(cdf.begin() + static_cast<std::ptrdiff_t>(last), cdf.end(), 1.0);
  return cdf;
}

std::int32_t binomial_count(const word_source& source, std::int32_t ntrial, double p) {
  const binomial_law law(ntrial, p);
  std::int32_t count = law.flipped ? ntrial : 0;
  if (law.constant())
    return count;
  if (law.by_table()) {
    double u;
    canonical<double>(source, 0, 1).draw(source, 1, &u);
    invert_binomial(law, 1)(&u, 1, &count);
  } else {
    draw_under_hat(source, btpe(law, 1), 1, &count);
  }
  return count;
}

}  // namespace

bool is_law(const double* p, std::size_t categories) {
  // Also false for numbers that are none.
  if (!std::all_of(p, p + categories, [](double x) { return x >= 0; }))
    return false;
  const auto error = static_cast<double>(std::fabs(sum(p, categories) - 1));
  return error <= sum_tolerance * static_cast<double>(categories);
}

counted_trials::counted_trials(std::size_t ntrial, const double* p, std::size_t categories,
                               std::size_t rows)
    : ntrial_(ntrial), categories_(categories), table_(cdf_of(p, categories), ntrial * rows) {}

void counted_trials::operator()(const word_source& source, std::size_t rows,
                                std::int32_t* out) const {
  const canonical<double> reals(source, 0, 1);
  alignas(64) double u[block_words];
  std::int32_t category[block_words];
  std::fill_n(out, rows * categories_, 0);
  std::size_t in_row = 0;
  for (std::size_t left = rows * ntrial_; left != 0;) {
    const std::size_t count = std::min(left, block_words);
    reals.draw(source, count, u);
    table_.look_up(u, count, category);
    for (std::size_t i = 0; i < count; ++i) {
      ++out[category[i]];
      if (++in_row == ntrial_) {
        in_row = 0;
        out += categories_;
      }
    }
    left -= count;
  }
}

conditional_counts::conditional_counts(std::int32_t ntrial, const double* p, std::size_t categories)
    : ntrial_(ntrial), given_(categories) {
  long double rest = 0;
  for (std::size_t j = categories; j-- > 0;) {
    rest += p[j];
    given_[j] = p[j] > 0 ? static_cast<double>(p[j] / rest) : 0;
  }
}

void conditional_counts::operator()(const word_source& source, std::size_t rows,
                                    std::int32_t* out) const {
  for (std::size_t row = 0; row < rows; ++row) {
    std::int32_t left = ntrial_;
    for (const double p : given_) {
      const std::int32_t count = left > 0 ? binomial_count(source, left, p) : 0;
      *out++ = count;
      left -= count;
    }
  }
}

}  // namespace tarn::statistics
