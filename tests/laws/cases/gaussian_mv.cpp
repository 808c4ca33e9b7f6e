// SPDX-License-Identifier: Apache-2.0
// Correlated normals of several dimensions in the three layouts of the factor. Looked at: the first
// and the last component, a combination of all, and the independent normals z behind a result
// mean + T z, alone and in sums, which have the law of a single one only if they are uncorrelated.
#include <cmath>
#include <vector>

#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

namespace {

enum layout { full, packed, diagonal };

// A well-conditioned lower triangular factor and its storage.
template <class Real>
struct factor {
  std::size_t dimension;
  layout form;
  std::vector<Real> mean, matrix;

  factor(std::size_t d, layout f) : dimension(d), form(f) {
    for (std::size_t r = 0; r < d; ++r)
      mean.push_back(static_cast<Real>(r % 3) - Real(0.5));
    if (form == full) {
      // What stands above the diagonal is not part of it.
      for (std::size_t r = 0; r < d; ++r) {
        for (std::size_t c = 0; c < d; ++c)
          matrix.push_back(c <= r ? chosen(r, c) : Real(99));
      }
    } else {
      for (std::size_t c = 0; c < d; ++c) {
        for (std::size_t r = c; r < (form == packed ? d : c + 1); ++r)
          matrix.push_back(chosen(r, c));
      }
    }
  }

  double at(std::size_t r, std::size_t c) const {
    return form == diagonal && r != c ? 0 : static_cast<double>(chosen(r, c));
  }

  // z with T z = x - mean.
  std::vector<double> solve(const double* x) const {
    std::vector<double> z(dimension);
    for (std::size_t r = 0; r < dimension; ++r) {
      double rest = x[r] - static_cast<double>(mean[r]);
      for (std::size_t c = 0; c < r; ++c)
        rest -= at(r, c) * z[c];
      z[r] = rest / at(r, r);
    }
    return z;
  }

  // The law of the combination sum v[r] x[r].
  law combination(const std::vector<double>& v) const {
    double centre = 0, variance = 0;
    for (std::size_t c = 0; c < dimension; ++c) {
      double t = 0;
      for (std::size_t r = c; r < dimension; ++r)
        t += v[r] * at(r, c);
      variance += t * t;
      centre += v[c] * static_cast<double>(mean[c]);
    }
    return gaussian(centre, std::sqrt(variance));
  }

 private:
  Real chosen(std::size_t r, std::size_t c) const {
    if (r == c)
      return Real(1) + static_cast<Real>(r % 4) / 4;
    return static_cast<Real>(std::cos(static_cast<double>(r + 2 * c))) /
           static_cast<Real>(dimension);
  }
};

template <class Real>
std::vector<view> views_of(const factor<Real>& t) {
  const std::size_t d = t.dimension, last = d - 1;
  // Sums of d terms of the order of 1, and back through the triangle.
  grain resolution = resolution_of<Real>(0);
  resolution.place = 4 * static_cast<double>(d);
  std::vector<double> first(d), end(d), all(d);
  first[0] = end[last] = 1;
  for (std::size_t r = 0; r < d; ++r)
    all[r] = r % 2 == 0 ? 1 : -0.7;
  std::vector<view> views;
  views.push_back({t.combination(first), resolution});
  views.push_back({t.combination(end), resolution, [=](const double* x) { return x[last]; }});
  views.push_back({t.combination(all), resolution, [=](const double* x) {
                     double sum = 0;
                     for (std::size_t r = 0; r < d; ++r)
                       sum += all[r] * x[r];
                     return sum;
                   }});
  views.push_back({gaussian(0, 1), resolution, [=](const double* x) { return t.solve(x)[last]; }});
  if (d > 1) {
    const double half = std::sqrt(0.5);
    views.push_back({gaussian(0, 1), resolution, [=](const double* x) {
                       const auto z = t.solve(x);
                       return half * (z[0] + z[last]);
                     }});
    views.push_back({gaussian(0, 1), resolution, [=](const double* x) {
                       const auto z = t.solve(x);
                       return half * (z[last - 1] - z[last]);
                     }});
  }
  return views;
}

template <class Real>
void add(std::vector<specimen>& all) {
  for (const std::size_t d : {1u, 2u, 4u, 15u}) {
    for (const layout form : {full, packed, diagonal}) {
      for (const std::int64_t method : {0, 1, 2}) {
        const factor<Real> t(d, form);
        const auto dimension = static_cast<std::int32_t>(d);
        specimen s = routine(laws::form_name<Real>("RngGaussianMV"),
                             laws::form<Real>(rvxsRngGaussianMV, rvxdRngGaussianMV), method,
                             gaussian(0, 1), resolution_of<Real>(0), dimension, int{form},
                             static_cast<const Real*>(nullptr), static_cast<const Real*>(nullptr));
        s.parameters = std::to_string(d) + ", layout " + std::to_string(form);
        s.width = d;
        s.paired = method == RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2;
        s.views = views_of(t);
        s.draw = [=](rvx_stream stream, std::size_t n, void* r) {
          const auto draw = laws::form<Real>(rvxsRngGaussianMV, rvxdRngGaussianMV);
          return draw(method, stream, static_cast<std::int64_t>(n), static_cast<Real*>(r),
                      dimension, form, t.mean.data(), t.matrix.data());
        };
        all.push_back(s);
      }
    }
  }
}

}  // namespace

std::vector<specimen> gaussian_mv_cases() {
  std::vector<specimen> all;
  add<float>(all);
  add<double>(all);
  return all;
}

}  // namespace laws
