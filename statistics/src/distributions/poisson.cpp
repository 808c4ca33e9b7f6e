// SPDX-License-Identifier: Apache-2.0
// What a call of a Poisson routine prepares once for its rate.
#include "distributions/poisson.hpp"

#include <algorithm>
#include <cmath>
#include <utility>
#include <vector>

namespace tarn::statistics {

poisson_steps::poisson_steps(double lambda)
    : lambda_(lambda), term_(std::exp(-lambda_)), sum_(term_) {}

double poisson_steps::next() {
  const auto reached = static_cast<double>(sum_);
  term_ *= lambda_ / ++k_;
  // The terms fall behind the mode; rounding may leave their sum just below 1.
  if (k_ > lambda_ && term_ < 0x1p-60L)
    sum_ = 1;
  else
    sum_ += term_;
  return reached;
}

guide_table poisson_table(double lambda, std::size_t uses) {
  std::vector<double> cdf;
  cdf.reserve(most_small_values);
  poisson_steps steps(lambda);
  do
    cdf.push_back(steps.next());
  while (cdf.back() < 1);
  return guide_table(std::move(cdf), uses);
}

void poisson_by_steps(const double* u, std::size_t n, double lambda, std::int32_t* out) {
  const double most = std::min(*std::max_element(u, u + n), guide_table::greatest);
  double cdf[most_small_values];
  double* step = cdf;
  poisson_steps steps(lambda);
  while ((*step = steps.next()) <= most)
    ++step;
  count_steps(u, n, cdf, out);
}

// Interpolated with 40 digits.
const double poisson_expansion::g[g_terms] = {
    0.16666666666666667,    -0.013889921910537538,   0.0037043357969813983,  -0.0013149386421412099,
    0.00054866023981103621, -0.00032550642051770164, 0.00016858518616033468, 4.2577757572875965e-5,
    -3.0705763003719182e-5, -8.5692711087252277e-5,  5.1170317330205409e-5};
const double poisson_expansion::c0[c0_terms] = {
    0.33333333333333333,     -0.027784750410179114,   0.0086464836807082281, -0.0034154251961907691,
    0.0015834772992949559,   -0.0012967937890119267,  0.0007499036145219146, 0.00045581846378795975,
    -0.00030993801335667524, -0.00051186011411298653, 0.00032562396534047764};
const double poisson_expansion::c1[c1_terms] = {
    -0.019753086419753086, 0.019370716119578965, -0.014199191064565641, -0.003414558305433047,
    0.0024280779692741746, 0.019744184146742047, -0.013894958631414797};

poisson_expansion::poisson_expansion(double lambda) {
  lambda = std::min(lambda, greatest_rate);
  double power = 1;  // of ds / de
  for (int i = 0; i < terms; ++i) {
    double of_s = i < 2 ? lambda : lambda * g[i - 2];
    of_s += i < c0_terms ? c0[i] : 0;
    of_s += i < c1_terms ? c1[i] / lambda : 0;
    coefficient[i] = of_s * power;
    power *= std::sqrt(2 / lambda);
  }
}

namespace {

// Cells of 2 / cells each. Above greatest_guided_rate too many of them hold a step.
constexpr std::size_t cells = std::size_t{1} << 13;
constexpr double greatest_guided_rate = 20000;
// Making guides costs as much as this many values save (measured).
constexpr std::size_t uses_of_guides = std::size_t{1} << 16;

// x moved by less than a value's distance from the next but by more than rounding, of x or of the
// place of a number among the cells, can do.
poisson_expansion moved(poisson_expansion x, double distance) {
  x.coefficient[0] += distance;
  return x;
}

}  // namespace

poisson_quantiles::poisson_quantiles(double lambda, std::size_t uses) : x_(lambda) {
  if (uses < uses_of_guides || lambda > greatest_guided_rate)
    return;
  std::vector<double> edges(cells + 1);
  for (std::size_t i = 0; i <= cells; ++i)
    edges[i] = static_cast<double>(i) * (2.0 / cells) - 1;
  std::vector<std::int32_t> greatest(cells);
  guides_.resize(cells);
  poisson_by_normal(edges.data(), cells, moved(x_, -1e-6), guides_.data());
  poisson_by_normal(edges.data() + 1, cells, moved(x_, 1e-6), greatest.data());
  for (std::size_t i = 0; i < cells; ++i)
    if (guides_[i] != greatest[i])
      guides_[i] = -1;
}

void poisson_quantiles::operator()(const double* u, std::size_t n, std::int32_t* out) const {
  if (guides_.empty()) {
    poisson_by_normal(u, n, x_, out);
    return;
  }
  if (!look_up_guides(u, n, -1, guides_, out))
    return;
  double open[block_words];
  std::int32_t place[block_words], value[block_words];
  std::size_t count = 0;
  for (std::size_t i = 0; i < n; ++i) {
    open[count] = u[i];
    place[count] = static_cast<std::int32_t>(i);
    count += out[i] < 0;
  }
  poisson_by_normal(open, count, x_, value);
  for (std::size_t i = 0; i < count; ++i)
    out[place[i]] = value[i];
}

}  // namespace tarn::statistics
