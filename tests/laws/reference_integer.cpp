// SPDX-License-Identifier: Apache-2.0
// Laws of integer variates.
#include <cmath>
#include <limits>
#include <memory>
#include <vector>

#include <boost/math/distributions/bernoulli.hpp>
#include <boost/math/distributions/binomial.hpp>
#include <boost/math/distributions/geometric.hpp>
#include <boost/math/distributions/negative_binomial.hpp>
#include <boost/math/distributions/normal.hpp>
#include <boost/math/distributions/poisson.hpp>

#include "reference.hpp"

namespace laws {

namespace {

namespace bm = boost::math;
using in_double = bm::policies::policy<bm::policies::promote_double<false>>;
using function = std::function<double(double)>;

constexpr double infinity = std::numeric_limits<double>::infinity();

// The least integer from `lower` on for which `enough` holds, which then holds for all above. The
// search doubles its steps away from `start`, then halves.
double least(double lower, double start, const std::function<bool(double)>& enough) {
  double high = std::max(lower, std::floor(start)), step = 1;
  while (!enough(high)) {
    high += step;
    step *= 2;
  }
  double low = high;
  step = 1;
  while (low >= lower && enough(low)) {
    high = low;
    low -= step;
    step *= 2;
  }
  low = std::max(low, lower - 1);
  while (high - low > 1) {
    const double middle = std::floor(low + (high - low) / 2);
    (enough(middle) ? high : low) = middle;
  }
  return high;
}

// From functions that are right inside the support. Quantiles of Boost have rounding policies of
// their own; these are by definition.
law integer_law(double lower, double upper, double mean, double deviation, const function& cdf,
                const function& pmf) {
  const function whole = [=](double x) {
    return x < lower ? 0 : x >= upper ? 1 : cdf(std::floor(x));
  };
  // The search begins where a normal law has the quantile.
  const auto guess = [=](double p) {
    const double inside = std::min(std::max(p, 1e-15), 1 - 1e-15);
    const double x = mean + deviation * bm::quantile(bm::normal(), inside);
    return std::min(std::max(x, lower), upper);
  };
  return {true,
          lower,
          upper,
          whole,
          [=](double p) { return least(lower, guess(p), [&](double k) { return whole(k) >= p; }); },
          [=](double q) {
            return least(lower, guess(1 - q), [&](double k) { return 1 - whole(k) <= q; });
          },
          [=](double k) { return k < lower || k > upper ? 0 : pmf(k); }};
}

template <class Distribution>
law integer_law(double lower, double upper, const Distribution& d) {
  return integer_law(
      lower, upper, bm::mean(d), bm::standard_deviation(d), [=](double k) { return bm::cdf(d, k); },
      [=](double k) { return bm::pdf(d, k); });
}

law constant(double k) {
  return integer_law(
      k, k, k, 0, [](double) { return 1; }, [](double) { return 1; });
}

}  // namespace

law integers(double a, double b) {
  return integer_law(
      a, b - 1, (a + b) / 2, (b - a) / 4, [=](double k) { return (k - a + 1) / (b - a); },
      [=](double) { return 1 / (b - a); });
}

law bernoulli(double p) {
  if (p == 0 || p == 1)
    return constant(p);
  return integer_law(0, 1, bm::bernoulli_distribution<double, in_double>(p));
}

law geometric(double p) {
  if (p == 1)
    return constant(0);
  return integer_law(0, infinity, bm::geometric_distribution<double, in_double>(p));
}

law binomial(int ntrial, double p) {
  if (p == 0 || p == 1 || ntrial == 0)
    return constant(p * ntrial);
  return integer_law(0, ntrial, bm::binomial_distribution<double, in_double>(ntrial, p));
}

law negative_binomial(double a, double p) {
  if (p == 1)
    return constant(0);
  return integer_law(0, infinity, bm::negative_binomial_distribution<double, in_double>(a, p));
}

law poisson(double lambda) {
  return integer_law(0, infinity, bm::poisson_distribution<double, in_double>(lambda));
}

// Boost's cdf sums its pmf at every call. Here all values next to the mode come from the ratio of
// neighbours, pmf(k + 1) / pmf(k) = (m - k) (s - k) / ((k + 1) (l - m - s + k + 1)), and are
// normalised by their sum; the tests of these laws compare with Boost.
law hypergeometric(int l, int s, int m) {
  const double lot = l, sample = s, marked = m;
  const double lower = std::max(0.0, sample + marked - lot), upper = std::min(sample, marked);
  if (lower == upper)
    return constant(lower);
  const double mode =
      std::min(upper, std::max(lower, std::floor((sample + 1) * (marked + 1) / (lot + 2))));
  const auto ratio = [=](double k) {
    return (marked - k) * (sample - k) / ((k + 1) * (lot - marked - sample + k + 1));
  };
  constexpr double negligible = 1e-30;
  std::vector<double> down, up{1};
  for (double k = mode, f = 1; k > lower && f > negligible; --k)
    down.push_back(f /= ratio(k - 1));
  for (double k = mode, f = 1; k < upper && f > negligible; ++k)
    up.push_back(f *= ratio(k));
  auto pmf = std::make_shared<std::vector<double>>(down.rbegin(), down.rend());
  pmf->insert(pmf->end(), up.begin(), up.end());
  double total = 0;
  for (const double f : *pmf)
    total += f;
  auto cdf = std::make_shared<std::vector<double>>();
  double sum = 0;
  for (double& f : *pmf) {
    f /= total;
    cdf->push_back(std::min(1.0, sum += f));
  }
  const double first = mode - static_cast<double>(down.size());
  const double last = first + static_cast<double>(pmf->size()) - 1;
  return integer_law(
      lower, upper, mode, std::sqrt(mode + 1),
      [=](double k) {
        return k < first ? 0 : k >= last ? 1 : (*cdf)[static_cast<std::size_t>(k - first)];
      },
      [=](double k) {
        return k < first || k > last ? 0 : (*pmf)[static_cast<std::size_t>(k - first)];
      });
}

}  // namespace laws
