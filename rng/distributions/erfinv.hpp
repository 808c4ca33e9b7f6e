// SPDX-License-Identifier: Apache-2.0
// The inverse error function in kernels: x times a cubic in the segment of t = 1 - |x|, from the
// tables that the host road reads (statistics/common/erfinv_layout.hpp). Between -1 and 1 both
// roads give the same bits, but for floats of |x| <= 2^-25.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "statistics/common/erfinv_tables.hpp"

namespace kestrel::tarn::rng::detail::gpu {

namespace erfinv_tables = ::tarn::statistics::erfinv_tables;

/// A table that a function can keep as a constant of its own: not every device compiler lets a
/// kernel index a constant array of a namespace.
template <typename Real, int rows>
struct cubics {
  alignas(64) Real row[rows][4];
};

template <typename Real, int rows>
SYCL_EXTERNAL constexpr cubics<Real, rows> copied(const Real (&from)[rows][4]) {
  cubics<Real, rows> to{};
  for (int i = 0; i < rows; ++i) {
    for (int j = 0; j < 4; ++j) {
      to.row[i][j] = from[i][j];
    }
  }
  return to;
}

/// ((c3 x + c2) x + c1) x + c0.
template <typename Real>
SYCL_EXTERNAL Real cubic(Real c3, Real c2, Real c1, Real c0, Real x) {
  return sycl::fma(sycl::fma(sycl::fma(c3, x, c2), x, c1), x, c0);
}

/// erfinv(x) for -1 <= x <= 1, with the relative error of the cubics: below 1.4e-7 in float and
/// 7.4e-9 in double. The ends give the value of their neighbours, 3.83 and 5.86.
template <typename Real>
SYCL_EXTERNAL Real erfinv_wrapper(Real x);

/// For |x| <= 2^-25, where 1 - |x| is 1, the cubic of the first segment is read at its other end,
/// 0.10 per cent above; results depend on it. Beyond 1 the result has no meaning.
template <>
SYCL_EXTERNAL inline float erfinv_wrapper<float>(float x) {
  static constexpr auto table = copied(erfinv_tables::float_rows);
  constexpr int shift = erfinv_tables::float_segment_shift;
  if (x == 1) {
    return erfinv_tables::float_end;
  }
  if (x == -1) {
    return -erfinv_tables::float_end;
  }
  const float size = sycl::fabs(x);
  const auto t = sycl::bit_cast<std::uint32_t>(1 - size);
  const auto mantissa = (t & ((1u << shift) - 1)) | 0x3F800000u;
  const float r = sycl::bit_cast<float>(mantissa) - erfinv_tables::float_center;
  // 2^-24 < |x| < 1 on its bits; a NaN has no row, either.
  const bool has_row = sycl::bit_cast<std::uint32_t>(size) + 0xCC7FFFFFu < 0x0BFFFFFFu;
  const std::uint32_t first = erfinv_tables::float_first_segment;
  const float* c = table.row[has_row ? first - (t >> shift) : 0];
  return cubic(c[3], c[2], c[1], c[0], r) * x;
}

/// NaN beyond 1.
template <>
SYCL_EXTERNAL inline double erfinv_wrapper<double>(double x) {
  static constexpr auto table = copied(erfinv_tables::double_rows);
  constexpr int shift = erfinv_tables::double_segment_shift;
  const double size = sycl::fabs(x);
  if (size == 1) {
    return sycl::copysign(erfinv_tables::double_end, x);
  }
  if (!(size < 1)) {
    return size > 1 ? sycl::nan(std::uint64_t{0}) : x + x;
  }
  const double t = 1 - size;
  const std::int64_t segment = sycl::bit_cast<std::int64_t>(t) >> shift;
  const auto middle = sycl::bit_cast<double>((segment << shift) | erfinv_tables::double_middle);
  const double* c = table.row[segment - erfinv_tables::double_first_segment];
  return cubic(c[0], c[1], c[2], c[3], t - middle) * x;
}

}  // namespace kestrel::tarn::rng::detail::gpu
