// SPDX-License-Identifier: Apache-2.0
// Correlated normals whose terms are beyond the range of their type: results are what the sums give
// that know no greatest exponent, kept within the finite numbers, whichever terms cancel. With
// means and factors next to the greatest number and words at the ends.
#include <cmath>
#include <limits>

#include <boost/multiprecision/cpp_bin_float.hpp>

#include "support.hpp"

namespace {

using gaussian_mv_range = support::on_simd_target;
using wide = boost::multiprecision::cpp_bin_float_quad;

int draw(std::int64_t method, rvx_stream s, float* r, std::int32_t d, std::int32_t layout,
         const float* mean, const float* matrix) {
  return rvxsRngGaussianMV(method, s, 1, r, d, layout, mean, matrix);
}
int draw(std::int64_t method, rvx_stream s, double* r, std::int32_t d, std::int32_t layout,
         const double* mean, const double* matrix) {
  return rvxdRngGaussianMV(method, s, 1, r, d, layout, mean, matrix);
}
int normals(std::int64_t method, rvx_stream s, std::int64_t n, float* r) {
  return rvxsRngGaussian(method, s, n, r, 0, 1);
}
int normals(std::int64_t method, rvx_stream s, std::int64_t n, double* r) {
  return rvxdRngGaussian(method, s, n, r, 0, 1);
}

// Rounded to the digits of a type, whatever the exponent.
template <class Real>
wide rounded(const wide& x) {
  int exponent = 0;
  const wide digits = frexp(x, &exponent);
  return ldexp(wide(static_cast<Real>(digits)), exponent);
}

enum layout { full, packed, diagonal };

template <class Real>
struct factor {
  std::int32_t d;
  std::vector<Real> mean, rows;

  // The entry of the factor, at its place in a layout; entries above the diagonal do not count.
  std::vector<Real> matrix(layout form) const {
    const auto width = static_cast<std::size_t>(d);
    if (form == full)
      return rows;
    std::vector<Real> m;
    for (std::size_t c = 0; c < width; ++c)
      for (std::size_t r = c; r < (form == packed ? width : c + 1); ++r)
        m.push_back(rows[r * width + c]);
    return m;
  }
};

template <class Real>
factor<Real> extreme_factor(std::int32_t d, std::uint64_t seed) {
  constexpr Real most = std::numeric_limits<Real>::max();
  const Real numbers[] = {most, -most, most / 2, -most / 2, most / 16, -most / 64, 1, 0};
  support::test_data data(seed);
  factor<Real> t{d, {}, {}};
  const auto width = static_cast<std::size_t>(d);
  for (std::size_t i = 0; i < width * (width + 1); ++i)
    (i < width ? t.mean : t.rows).push_back(numbers[data.below(8)]);
  return t;
}

struct tally {
  std::size_t clamped = 0, cancelled = 0, plain = 0;
};

template <class Real>
void compare(std::int64_t method, layout form, const factor<Real>& t, const plain::four& words,
             tally& seen) {
  constexpr plain::two key{5, 6};
  constexpr Real most = std::numeric_limits<Real>::max();
  const auto width = static_cast<std::size_t>(t.d);
  support::stream s;
  s.set(key, plain::counter_of(words, key), 0);
  std::vector<Real> z(width);
  ASSERT_EQ(normals(method, s, t.d, z.data()), 0);
  s.set(key, plain::counter_of(words, key), 0);
  support::results<Real> x(width);
  ASSERT_EQ(draw(method, s, x.data(), t.d, form, t.mean.data(), t.matrix(form).data()), 0);
  EXPECT_TRUE(x.guards_intact());
  for (std::size_t r = 0; r < width; ++r) {
    wide sum = 0;
    Real in_type = 0;
    for (std::size_t c = form == diagonal ? r : 0; c <= r; ++c) {
      const Real entry = t.rows[r * width + c];
      sum = rounded<Real>(sum + rounded<Real>(wide(entry) * z[c]));
      in_type += entry * z[c];
    }
    sum = rounded<Real>(sum + t.mean[r]);
    in_type += t.mean[r];
    const bool beyond = abs(sum) > most;
    const Real expected = beyond ? (sum > 0 ? most : -most) : static_cast<Real>(sum);
    ASSERT_EQ(x[r], expected) << "entry " << r << " of " << t.d << ", layout " << form;
    seen.clamped += beyond;
    seen.cancelled += !beyond && !std::isfinite(in_type);
    seen.plain += std::isfinite(in_type);
  }
}

template <class Real>
void compare_all() {
  constexpr std::uint32_t ends[] = {0x80000000, 0x7FFFFFFF, 0x80000001, 0, 0x40000000, 1};
  tally seen;
  std::uint64_t seed = 0;
  for (const std::int32_t d : {1, 2, 3, 5, 8, 17, 33})
    for (const std::int64_t method : {0, 1, 2})
      for (const std::uint32_t a : ends)
        for (const std::uint32_t b : ends) {
          const factor<Real> t = extreme_factor<Real>(d, ++seed);
          for (const layout form : {full, packed, diagonal})
            ASSERT_NO_FATAL_FAILURE(compare(method, form, t, {a, b, b, a}, seen));
        }
  EXPECT_GT(seen.clamped, 1000u);
  EXPECT_GT(seen.cancelled, 1000u);
  EXPECT_GT(seen.plain, 1000u);
}

TEST_F(gaussian_mv_range, floats) {
  compare_all<float>();
}
TEST_F(gaussian_mv_range, doubles) {
  compare_all<double>();
}

}  // namespace
