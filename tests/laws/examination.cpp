// SPDX-License-Identifier: Apache-2.0
#include "examination.hpp"

#include <algorithm>
#include <cmath>
#include <limits>
#include <sstream>

#include "critical.hpp"

namespace laws {

namespace {

constexpr std::size_t most_cells = 500;
// Values expected in either tail: enough to tell too few as well as too many.
constexpr double tail_values = 50;

}  // namespace

double grain::at(double x) const {
  return std::isfinite(x) ? relative * (std::fabs(x) + std::fabs(place)) + least : 0;
}

examination::examination(const law& expected, const grain& resolution, std::size_t n)
    : law_(expected),
      grain_(resolution),
      n_(n),
      tail_(std::min(0.25, tail_values / static_cast<double>(n))),
      moments_(clamp(expected, tail_)) {
  place_boundaries();
  for (const boundary& b : boundaries_)
    places_.push_back(b.x);
  counts_.resize(boundaries_.size() + 1);
}

// The ends of the tails and, between them, quantiles of equal steps.
void examination::place_boundaries() {
  const auto cells = static_cast<std::size_t>(
      std::min<double>(most_cells, static_cast<double>(n_) / least_expected));
  std::vector<double> x{moments_.low};
  for (std::size_t i = 1; i < cells; ++i)
    x.push_back(law_.below(static_cast<double>(i) / static_cast<double>(cells)));
  x.push_back(moments_.high);
  std::sort(x.begin(), x.end());
  x.erase(std::unique(x.begin(), x.end()), x.end());
  for (const double b : x) {
    const double r = law_.discrete ? 0 : grain_.at(b);
    const double blur = grain_.probability;
    boundaries_.push_back({b, law_.cdf(b - r) - blur, law_.cdf(b), law_.cdf(b + r) + blur});
  }
}

void examination::add(double x) {
  const double r = grain_.exact_range ? 0 : grain_.at(x);
  if (!std::isfinite(x) || x < law_.lower - r || x > law_.upper + r) {
    ++outside_;
    return;
  }
  const auto cell = std::lower_bound(places_.begin(), places_.end(), x) - places_.begin();
  ++counts_[static_cast<std::size_t>(cell)];
  const double z = moments_.standard(x);
  double power = 1;
  for (double& sum : sums_)
    sum += power *= z;
}

std::vector<finding> examination::findings() const {
  std::vector<finding> all{range(), distance()};
  if (moments_.spread == 0)
    return all;
  all.push_back(chi_square());
  const auto find = [&](double x) {
    return static_cast<std::size_t>(std::lower_bound(places_.begin(), places_.end(), x) -
                                    places_.begin());
  };
  all.push_back(tail(find(moments_.low), false));
  all.push_back(tail(find(moments_.high), true));
  for (std::size_t k = 0; k < 4; ++k)
    all.push_back(moment(k));
  return all;
}

finding examination::range() const {
  return {"values outside the support", static_cast<double>(outside_), 0};
}

// Values up to a boundary.
double examination::accumulated(std::size_t last) const {
  std::size_t sum = 0;
  for (std::size_t i = 0; i <= last; ++i)
    sum += counts_[i];
  return static_cast<double>(sum);
}

finding examination::distance() const {
  ++tests_made();
  double greatest = 0, sum = 0;
  for (std::size_t i = 0; i < boundaries_.size(); ++i) {
    sum += static_cast<double>(counts_[i]);
    const double share = sum / static_cast<double>(n_);
    greatest = std::max({greatest, share - boundaries_[i].most, boundaries_[i].least - share});
  }
  return {"Kolmogorov-Smirnov distance", greatest, critical_distance(n_)};
}

// Cells are joined until they expect enough, and where the resolution would blur a count by more
// than a tenth of its deviation.
finding examination::chi_square() const {
  ++tests_made();
  const auto n = static_cast<double>(n_);
  struct cell {
    double expected, counted;
  };
  std::vector<cell> cells;
  double before = 0, counted = 0;
  for (std::size_t i = 0; i < boundaries_.size(); ++i) {
    const boundary& b = boundaries_[i];
    counted += static_cast<double>(counts_[i]);
    const double expected = n * (b.exact - before);
    const double rest = n * (1 - b.exact);
    const double blur = n * (b.most - b.least) / 2;
    if (std::min(expected, rest) < least_expected || blur > 0.1 * std::sqrt(expected))
      continue;
    cells.push_back({expected, counted});
    before = b.exact;
    counted = 0;
  }
  cells.push_back({n * (1 - before), counted + static_cast<double>(counts_.back())});
  double statistic = 0;
  for (const cell& c : cells)
    statistic += (c.counted - c.expected) * (c.counted - c.expected) / c.expected;
  if (cells.size() < 2)
    return {"chi-square", 0, 0};
  return {"chi-square of " + std::to_string(cells.size()) + " cells", statistic,
          critical_chi_square(cells.size())};
}

// Values up to the end of a tail, or above it.
finding examination::tail(std::size_t end, bool upper) const {
  ++tests_made();
  const double up_to = accumulated(end);
  const double count = upper ? static_cast<double>(n_ - outside_) - up_to : up_to;
  const auto& b = boundaries_[end];
  const double least = upper ? 1 - b.most : b.least, most = upper ? 1 - b.least : b.most;
  const bool possible = count_is_possible(static_cast<std::size_t>(count), n_, least, most);
  const double expected = (upper ? 1 - b.exact : b.exact) * static_cast<double>(n_);
  std::ostringstream name;
  name << "values " << (upper ? "above " : "up to ") << b.x << " (" << expected << " expected)";
  return {name.str(), count, possible ? count : std::numeric_limits<double>::quiet_NaN()};
}

finding examination::moment(std::size_t k) const {
  ++tests_made();
  const double critical = critical_mean(n_, moments_.variance[k], moments_.reach[k]);
  const double mean = sums_[k] / static_cast<double>(n_);
  return {"moment " + std::to_string(k + 1), std::fabs(mean - moments_.mean[k]), critical};
}

std::string failures(const std::vector<finding>& all) {
  std::ostringstream text;
  for (const finding& f : all) {
    if (f.failed())
      text << f.test << ": " << f.statistic << ", critical " << f.critical << "\n";
  }
  return text.str();
}

}  // namespace laws
