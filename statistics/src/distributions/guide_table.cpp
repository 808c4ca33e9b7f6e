// SPDX-License-Identifier: Apache-2.0
// Building and reading tables of guides.
#include "distributions/guide_table.hpp"

#include <utility>

#include "blocks.hpp"

namespace tarn::statistics {

namespace {

// About `uses` cells, no more than pay: with 32 for each value few cells hold a step of the cdf,
// and up to 2^13 of them stay in the nearest cache. A power of two, so that finding the cell of a
// number is exact.
std::size_t choose_cells(std::size_t values, std::size_t uses) {
  const std::size_t enough = std::max(std::min(32 * values, std::size_t{1} << 13), 2 * values);
  std::size_t cells = 1;
  while (2 * cells <= std::min(uses, enough))
    cells *= 2;
  return cells;
}

}  // namespace

guide_table::guide_table(std::vector<double> cdf, std::size_t uses)
    : cdf_(std::move(cdf)), guides_(uses < worth ? 0 : choose_cells(cdf_.size(), uses)) {
  if (guides_.empty())
    return;
  const double width = 1 / static_cast<double>(guides_.size());
  std::int32_t value = 0;
  for (std::size_t cell = 0; cell < guides_.size(); ++cell) {
    value = search(static_cast<double>(cell) * width, value);
    const double end = static_cast<double>(cell + 1) * width;
    guides_[cell] = cdf_[static_cast<std::size_t>(value)] >= end ? value : ~value;
  }
}

void guide_table::look_up(const double* u, std::size_t n, std::int32_t* out) const {
  if (guides_.empty()) {
    count_steps(u, n, cdf_.data(), out);
    return;
  }
  while (n != 0) {
    const std::size_t count = std::min(n, block_words);
    if (look_up_guides(u, count, 0, guides_, out))
      for (std::size_t j = 0; j < count; ++j)
        if (out[j] < 0)
          out[j] = search(u[j], ~out[j]);
    u += count;
    out += count;
    n -= count;
  }
}

}  // namespace tarn::statistics
