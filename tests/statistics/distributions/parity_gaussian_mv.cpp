// SPDX-License-Identifier: Apache-2.0
// Correlated normals against standard normals of the same stream and a plain triple loop, bit for
// bit: column after column, each product and sum rounded, the mean last.
#include <cmath>

#include <boost/math/distributions/normal.hpp>

#include "every_engine.hpp"
#include "support.hpp"

namespace {

using gaussian_mv = support::on_simd_target;

int draw(std::int64_t method, rvx_stream s, std::size_t n, float* r, std::int32_t d,
         std::int32_t layout, const float* mean, const float* matrix) {
  return rvxsRngGaussianMV(method, s, static_cast<std::int64_t>(n), r, d, layout, mean, matrix);
}
int draw(std::int64_t method, rvx_stream s, std::size_t n, double* r, std::int32_t d,
         std::int32_t layout, const double* mean, const double* matrix) {
  return rvxdRngGaussianMV(method, s, static_cast<std::int64_t>(n), r, d, layout, mean, matrix);
}
int normals(std::int64_t method, rvx_stream s, std::size_t n, float* r) {
  return rvxsRngGaussian(method, s, static_cast<std::int64_t>(n), r, 0, 1);
}
int normals(std::int64_t method, rvx_stream s, std::size_t n, double* r) {
  return rvxdRngGaussian(method, s, static_cast<std::int64_t>(n), r, 0, 1);
}

constexpr std::int32_t full = 0, packed = 1, diagonal = 2;

// A factor in each layout. What stands above the diagonal is not a number.
template <class Real>
struct factor {
  std::size_t d;
  std::vector<Real> mean, rows, columns, diagonal_entries;

  explicit factor(std::size_t dimension, bool triangular = true) : d(dimension) {
    support::test_data data(dimension);
    const auto number = [&data] {
      return static_cast<Real>(static_cast<double>(data() >> 11) * 0x1p-52 - 1);
    };
    for (std::size_t r = 0; r < d; ++r) {
      mean.push_back(number());
      diagonal_entries.push_back(number());
    }
    if (!triangular)
      return;
    rows.assign(d * d, std::numeric_limits<Real>::quiet_NaN());
    for (std::size_t c = 0; c < d; ++c)
      for (std::size_t r = c; r < d; ++r) {
        rows[r * d + c] = r == c ? diagonal_entries[r] : number();
        columns.push_back(rows[r * d + c]);
      }
  }

  const Real* matrix(std::int32_t layout) const {
    return layout == full     ? rows.data()
           : layout == packed ? columns.data()
                              : diagonal_entries.data();
  }

  std::vector<Real> transformed(const Real* z, std::int32_t layout) const {
    std::vector<Real> x(d);
    if (layout == diagonal) {
      for (std::size_t r = 0; r < d; ++r)
        x[r] = diagonal_entries[r] * z[r];
    } else {
      for (std::size_t r = 0; r < d; ++r)
        x[r] = rows[r * d] * z[0];
      for (std::size_t c = 1; c < d; ++c)
        for (std::size_t r = c; r < d; ++r)
          x[r] = x[r] + rows[r * d + c] * z[c];
    }
    for (std::size_t r = 0; r < d; ++r)
      x[r] = x[r] + mean[r];
    return x;
  }
};

template <class Real>
void compare(std::int64_t method, std::int32_t layout, std::size_t d, std::size_t n) {
  SCOPED_TRACE("method " + std::to_string(method) + ", layout " + std::to_string(layout) +
               ", dimension " + std::to_string(d) + ", vectors " + std::to_string(n));
  const factor<Real> t(d, layout != diagonal);
  support::stream s(9), plain_stream(9);
  support::results<Real> x(n * d);
  std::vector<Real> z(n * d);
  ASSERT_EQ(draw(method, s, n, x.data(), static_cast<std::int32_t>(d), layout, t.mean.data(),
                 t.matrix(layout)),
            0);
  ASSERT_EQ(normals(method, plain_stream, n * d, z.data()), 0);
  for (std::size_t v = 0; v < n; ++v) {
    const std::vector<Real> expected = t.transformed(z.data() + v * d, layout);
    for (std::size_t r = 0; r < d; ++r)
      ASSERT_EQ(x[v * d + r], expected[r]) << "entry " << r << " of vector " << v;
  }
  EXPECT_TRUE(x.guards_intact());
  // As many words as normals, or twice that for method 0.
  support::stream words(9);
  ASSERT_EQ(rvxSkipAheadStream(words, static_cast<std::int64_t>(n * d * (method == 0 ? 2 : 1))), 0);
  EXPECT_TRUE(support::same_position(s, words.position()));
}

template <class Real>
void compare_all(std::size_t d, std::size_t n) {
  for (const std::int64_t method : {0, 1, 2})
    for (const std::int32_t layout : {full, packed, diagonal})
      ASSERT_NO_FATAL_FAILURE(compare<Real>(method, layout, d, n));
}

template <class Real>
void compare_dimensions() {
  for (std::size_t d = 1; d <= 35; ++d)
    for (const std::size_t n : {1u, 2u, 3u, 10u})
      ASSERT_NO_FATAL_FAILURE(compare_all<Real>(d, n));
  // Several blocks, with pairs of Box and Muller across vectors and an odd end.
  for (const std::size_t d : {1u, 3u, 7u, 64u, 129u, 1025u})
    ASSERT_NO_FATAL_FAILURE(compare_all<Real>(d, 6001 / d + 2));
}

TEST_F(gaussian_mv, floats_are_the_triple_loop) {
  compare_dimensions<float>();
}
TEST_F(gaussian_mv, doubles_are_the_triple_loop) {
  compare_dimensions<double>();
}

// Enough for threads, an odd number of vectors of odd dimension; and more words in one pair of
// vectors than a thread's piece.
TEST_F(gaussian_mv, long_calls) {
  ASSERT_NO_FATAL_FAILURE(compare_all<float>(5, 60001));
  ASSERT_NO_FATAL_FAILURE(compare_all<double>(11, 30001));
  for (const std::int64_t method : {0, 1, 2})
    ASSERT_NO_FATAL_FAILURE(compare<float>(method, diagonal, 40001, 5));
}

class engines_of_gaussian_mv : public gaussian_mv,
                               public testing::WithParamInterface<support::engine_case> {};

// Two calls are one where no pair is cut.
TEST_P(engines_of_gaussian_mv, pieces_join) {
  const factor<double> t(3);
  constexpr std::size_t n = 3000;
  for (const std::int64_t method : {0, 1, 2}) {
    support::any_stream whole = GetParam().make();
    support::any_stream parts = whole;
    support::results<double> a(3 * n), b(3 * n);
    ASSERT_EQ(draw(method, whole, n, a.data(), 3, packed, t.mean.data(), t.matrix(packed)), 0);
    ASSERT_EQ(draw(method, parts, 2, b.data(), 3, packed, t.mean.data(), t.matrix(packed)), 0);
    ASSERT_EQ(draw(method, parts, n - 2, b.data() + 6, 3, packed, t.mean.data(), t.matrix(packed)),
              0);
    EXPECT_TRUE(a == b);
    EXPECT_TRUE(a.guards_intact());
    EXPECT_EQ(whole.image(), parts.image());
  }
}

std::vector<support::engine_case> repeating_engines() {
  auto chosen = support::every_engine();
  chosen.erase(std::remove_if(chosen.begin(), chosen.end(),
                              [](const auto& e) { return e.code == RVX_BRNG_NONDETERM; }),
               chosen.end());
  return chosen;
}
INSTANTIATE_TEST_SUITE_P(each, engines_of_gaussian_mv, testing::ValuesIn(repeating_engines()),
                         support::engine_name<support::engine_case>);

}  // namespace
