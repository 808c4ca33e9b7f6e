// SPDX-License-Identifier: Apache-2.0
// Few and many trials over few and many categories, with impossible categories too; 799 and 800
// trials over three categories, where methods change (ntrial / 200 > categories). Looked at: the
// first and the last count, the sum of the first half of them, and the sum of all.
#include <numeric>
#include <vector>

#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

namespace {

double sum(const double* x, std::size_t n) {
  return std::accumulate(x, x + n, 0.0);
}

specimen of(std::int32_t ntrial, std::vector<double> p) {
  const std::size_t k = p.size();
  const double total = sum(p.data(), k);
  for (double& x : p)
    x /= total;
  const grain resolution = integer_resolution();
  const auto categories = static_cast<std::int32_t>(k);
  specimen s = routine("iRngMultinomial", rvxiRngMultinomial, 0, binomial(ntrial, 1), resolution,
                       ntrial, categories, static_cast<const double*>(nullptr));
  s.parameters = std::to_string(ntrial) + ", " + std::to_string(k) + " from " +
                 std::to_string(p[0]) + " to " + std::to_string(p[k - 1]);
  s.width = k;
  s.draw = [=](rvx_stream stream, std::size_t n, void* r) {
    return rvxiRngMultinomial(0, stream, static_cast<std::int64_t>(n),
                              static_cast<std::int32_t*>(r), ntrial, categories, p.data());
  };
  s.views.clear();
  s.views.push_back({binomial(ntrial, 1), resolution, [=](const double* r) { return sum(r, k); }});
  if (k > 1) {
    const std::size_t half = (k + 1) / 2;
    s.views.push_back({binomial(ntrial, p[0]), resolution});
    s.views.push_back(
        {binomial(ntrial, p[k - 1]), resolution, [=](const double* r) { return r[k - 1]; }});
    s.views.push_back({binomial(ntrial, sum(p.data(), half)), resolution,
                       [=](const double* r) { return sum(r, half); }});
  }
  return s;
}

// Weights 1, 2, 3, 1, 2, 3, ...
std::vector<double> uneven(std::size_t k) {
  std::vector<double> p(k);
  for (std::size_t i = 0; i < k; ++i)
    p[i] = static_cast<double>(1 + i % 3);
  return p;
}

}  // namespace

std::vector<specimen> multinomial_cases() {
  return {of(0, {1, 1, 1}),
          of(5, {1}),
          of(1, {1, 3}),
          of(1, uneven(40)),
          of(2, uneven(31)),
          of(2, uneven(32)),
          of(16, uneven(256)),
          of(17, uneven(300)),
          of(10, {0.2, 0.3, 0.1, 0.25, 0.15}),
          of(100, {1, 1, 1, 1}),
          of(1000, uneven(10)),
          of(799, uneven(3)),
          of(800, uneven(3)),
          of(50, {0, 0.5, 0, 0.5}),
          of(50, {0.5, 0.5, 0}),
          of(1000000, {0.7, 0.299, 0.001}),
          of(2147483647, {0.3, 0.7})};
}

}  // namespace laws
