// SPDX-License-Identifier: Apache-2.0
#include "clamped_moments.hpp"

#include <algorithm>
#include <cmath>
#include <vector>

#include <boost/math/quadrature/gauss.hpp>

namespace laws {

namespace {

// A law as values with weights that sum to 1: exact for discrete laws, else the nodes of Gauss'
// formula for integrals over the probability. Its pieces are halved towards both ends, where
// quantiles behave like powers and logarithms of the probability.
struct node {
  double x, weight;
};

void add_piece(double from, double to, const std::function<double(double)>& quantile,
               std::vector<node>& nodes) {
  using rule = boost::math::quadrature::gauss<double, 20>;
  const double middle = (from + to) / 2, half = (to - from) / 2;
  for (std::size_t i = 0; i < rule::abscissa().size(); ++i) {
    for (const double side : {-1, 1}) {
      const double u = middle + side * half * rule::abscissa()[i];
      nodes.push_back({quantile(u), half * rule::weights()[i]});
    }
  }
}

std::vector<node> real_nodes(const law& of, double tail) {
  std::vector<node> nodes;
  for (double to = 0.5; to > tail; to /= 2) {
    const double from = std::max(tail, to / 2);
    add_piece(from, to, of.below, nodes);
    add_piece(from, to, of.above, nodes);
  }
  return nodes;
}

std::vector<node> integer_nodes(const law& of, double low, double high) {
  std::vector<node> nodes;
  for (double k = low + 1; k < high; ++k)
    nodes.push_back({k, of.pmf(k)});
  return nodes;
}

}  // namespace

clamped_moments clamp(const law& of, double tail) {
  clamped_moments m{};
  m.low = of.below(tail);
  m.high = of.above(tail);
  // Steps of a discrete law so many that they are as good as none: the quantiles at some hundred
  // nodes are off by half a step, which is a few 1e-6 of the deviation in the mean over them.
  constexpr double many = 50'000;
  const bool exact = of.discrete && m.high - m.low < many;
  std::vector<node> nodes = exact ? integer_nodes(of, m.low, m.high) : real_nodes(of, tail);
  nodes.push_back({m.low, exact ? of.cdf(m.low) : tail});
  if (m.high > m.low)
    nodes.push_back({m.high, exact ? 1 - of.cdf(m.high - 1) : tail});

  const auto expect = [&](const auto& f) {
    double sum = 0;
    for (const node& n : nodes)
      sum += n.weight * f(n.x);
    return sum;
  };
  m.centre = expect([](double x) { return x; });
  m.spread = std::sqrt(expect([&](double x) { return (x - m.centre) * (x - m.centre); }));
  if (m.spread == 0)
    return m;
  for (int k = 1; k <= 4; ++k) {
    const auto power = [&](double x) { return std::pow(m.standard(x), k); };
    const auto i = static_cast<std::size_t>(k - 1);
    m.mean[i] = expect(power);
    m.variance[i] = expect([&](double x) { return std::pow(power(x) - m.mean[i], 2); });
    // An even power is least inside.
    const double least = k % 2 == 0 ? 0 : power(m.low);
    const double greatest = std::max(power(m.high), power(m.low));
    m.reach[i] = std::max(greatest - m.mean[i], m.mean[i] - least);
  }
  return m;
}

}  // namespace laws
