// SPDX-License-Identifier: Apache-2.0
// The tables of the inverse error function against the function in multiple precision.
#include <cmath>
#include <cstring>

#include <gtest/gtest.h>

#include "fit.hpp"
#include "statistics/common/erfinv_tables.hpp"

namespace {

namespace table = tarn::statistics::erfinv_tables;
using erfinv::exact;

// The largest relative error of a cubic at points of its segment, the ends included. Of the
// double segment from t = 1 on only its first point is ever read.
template <class Real>
double largest_error(const std::array<Real, 4>& c, const erfinv::segment& s) {
  double largest = 0;
  for (int i = -8; i <= 8; ++i) {
    const exact t = s.middle + s.half_width * i / 8;
    if (t == 1)
      continue;  // where x = 0: tested by itself
    const exact x = (t - s.middle) / s.unit;
    const exact p = ((c[3] * x + c[2]) * x + c[1]) * x + c[0];
    largest = std::max(largest, exact(abs(p / erfinv::quotient(t) - 1)).convert_to<double>());
  }
  return largest;
}

// Best cubics on these segments err by 1.03e-7 at most, from t = 1/2 on, the widest segment for
// its distance from where the function bends most; rounding of coefficients adds half a unit.
TEST(erfinv_table, floats_are_within_two_units) {
  double largest = 0;
  for (int row = 0; row < table::float_row_count; ++row) {
    const float* c = table::float_rows[row];
    const double error = largest_error<float>({c[0], c[1], c[2], c[3]}, erfinv::float_segment(row));
    ASSERT_LT(error, row % 8 == 7 ? 1.4e-7 : 1e-7) << row;
    largest = std::max(largest, error);
  }
  RecordProperty("largest_relative_error", std::to_string(largest * 1e9) + "e-9");
}

// Best cubics on sixteen segments an octave err by 7.3e-9 at most, at t = 1/2, and by less than
// 1e-9 over most of the table: about as much as a step of a word of 32 bits makes.
TEST(erfinv_table, doubles_hold_eight_digits) {
  double largest = 0;
  for (int row = 0; row + 1 < table::double_row_count; ++row) {
    const double* c = table::double_rows[row];
    largest = std::max(
        largest, largest_error<double>({c[3], c[2], c[1], c[0]}, erfinv::double_segment(row)));
    ASSERT_LT(largest, 7.4e-9) << row;
  }
  const double* c = table::double_rows[table::double_row_count - 1];
  const double d = -0x1p-5;  // t = 1
  EXPECT_NEAR(((c[0] * d + c[1]) * d + c[2]) * d + c[3], std::sqrt(std::acos(-1.0)) / 2, 1.7e-8);
  RecordProperty("largest_relative_error", std::to_string(largest * 1e9) + "e-9");
}

// Coefficients of best cubics known to eight digits. c1 and c3 hang together: a change of c3 by its
// eighth digit moves c1 by less than its own.
TEST(erfinv_table, telling_rows) {
  const struct {
    int row;
    float c[4];
  } known[] = {{0, {0.88645363f, -0.0072582168f, 0.058222048f, -0.0020025487f}},
               {1, {0.88827598f, -0.021963373f, 0.059744488f, -0.0061699022f}},
               {191, {3.8248360f, -0.11920058f, 0.054438535f, -0.033703573f}}};
  const double tolerance[] = {6e-8, 6e-8, 6e-8, 4e-7};  // relative
  for (const auto& k : known) {
    for (int i = 0; i < 4; ++i) {
      const float c = table::float_rows[k.row][i];
      EXPECT_NEAR(c, k.c[i], tolerance[i] * std::fabs(k.c[i])) << k.row << ' ' << i;
    }
  }
}

TEST(erfinv_table, ends_are_the_values_next_to_one) {
  EXPECT_EQ(table::float_end, 3.8325069f);
  EXPECT_EQ(table::double_end, 5.8635847487551676);
  const auto next = [](const exact& t) { return exact(erfinv::quotient(t) * (1 - t)); };
  EXPECT_EQ(next(0x1p-24).convert_to<float>(), table::float_end);
  EXPECT_EQ(next(0x1p-53).convert_to<double>(), table::double_end);
}

TEST(erfinv_table, is_what_the_tool_makes) {
  for (int row = 0; row < table::float_row_count; ++row) {
    const auto c = erfinv::fit<float>(erfinv::float_segment(row)).coefficients;
    ASSERT_EQ(std::memcmp(c.data(), table::float_rows[row], sizeof c), 0) << row;
  }
  for (int row = 0; row < table::double_row_count; row += 16) {
    const auto c = erfinv::fit<double>(erfinv::double_segment(row)).coefficients;
    for (std::size_t i = 0; i < 4; ++i)
      ASSERT_EQ(c[3 - i], table::double_rows[row][i]) << row;
  }
}

}  // namespace
