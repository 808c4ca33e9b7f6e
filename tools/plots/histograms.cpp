// SPDX-License-Identifier: Apache-2.0
// Histograms of values drawn.
#include "histograms.hpp"

#include <cmath>
#include <cstdint>
#include <fstream>
#include <stdexcept>

namespace {

constexpr std::size_t count = 1000000;
constexpr std::uint64_t seed = 1;

// Bars of equal width side by side.
struct bars {
  double start, width;
  std::size_t n;

  explicit bars(const plot& of)
      : start(of.integers ? of.low - 0.5 : of.low),
        width(of.integers ? 1 : (of.high - of.low) / 70),
        n(of.integers ? static_cast<std::size_t>(of.high - of.low) + 1 : 70) {}

  double middle(std::size_t bar) const { return start + (static_cast<double>(bar) + 0.5) * width; }
};

// The share of the values in each bar for each unit of length; those outside all bars count too.
std::vector<double> heights_of(const std::vector<double>& values, const bars& at) {
  std::vector<double> heights(at.n, 0);
  const double one = 1 / (static_cast<double>(values.size()) * at.width);
  for (const double x : values) {
    const double bar = std::floor((x - at.start) / at.width);
    if (bar >= 0 && bar < static_cast<double>(at.n))
      heights[static_cast<std::size_t>(bar)] += one;
  }
  return heights;
}

// Every plot starts from the same stream, so that none depends on the others.
std::vector<double> draw(const plot& of) {
  rvx_stream stream = nullptr;
  if (rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, seed) != RVX_STATUS_OK)
    throw std::runtime_error("no stream");
  const std::vector<double> values = of.draw(stream, count);
  rvxDeleteStream(&stream);
  return values;
}

}  // namespace

void write_columns(const plot& of, const std::string& folder) {
  const bars at(of);
  const std::vector<double> heights = heights_of(draw(of), at);
  std::ofstream file(folder + '/' + of.name + (of.integers ? ".probabilities" : ".density"));
  file << "at \"drawn, " << of.parameters << "\" law\n";
  for (std::size_t i = 0; i < at.n; ++i)
    file << at.middle(i) << ' ' << heights[i] << ' ' << of.law(at.middle(i)) << '\n';
  if (!file.flush())
    throw std::runtime_error("cannot write the columns of " + of.name);
}
