// SPDX-License-Identifier: Apache-2.0
// The inverse error function on whole vectors, the same bits on every SIMD target: x times a cubic
// in the segment of t = 1 - |x| (statistics/common/erfinv_layout.hpp), fused multiply-adds. For
// sources that are compiled once per target: include after <hwy/highway.h>, inside no namespace.
#include <cstddef>

#include "simd/fused-inl.hpp"
#include "simd/vector_math-inl.hpp"
#include "statistics/common/erfinv_tables.hpp"

#if defined(TARN_ERFINV_INL_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_ERFINV_INL_HPP
#undef TARN_ERFINV_INL_HPP
#else
#define TARN_ERFINV_INL_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// The coefficients of one cubic per lane, from a table of rows of four that start at the elements
// `at`. A row is loaded as a whole and turned with its neighbours: four gathers take twice the
// time.
template <class D>
struct four_vectors {
  hn::Vec<D> c0, c1, c2, c3;
};

#if HWY_TARGET == HWY_SCALAR

template <class D, class Index>
HWY_INLINE four_vectors<D> rows_at(D d, const hn::TFromD<D>* table, Index at) {
  const auto* row = table + hn::GetLane(at);
  return {hn::Load(d, row), hn::Load(d, row + 1), hn::Load(d, row + 2), hn::Load(d, row + 3)};
}

#else

// Blocks of 16 bytes at table + at[0], at[Step], at[2 Step], ... one after the other.
template <std::size_t Step, class D, class Offset>
HWY_INLINE hn::Vec<D> blocks_at(D d, const hn::TFromD<D>* table, const Offset* at) {
  constexpr std::size_t blocks = hn::MaxLanes(D()) * sizeof(hn::TFromD<D>) / 16;
  if constexpr (blocks == 1) {
    return hn::Load(d, table + at[0]);
  } else {
    const hn::Half<D> half;
    return hn::Combine(d, blocks_at<Step>(half, table, at + Step * blocks / 2),
                       blocks_at<Step>(half, table, at));
  }
}

template <class D, class Index>
HWY_INLINE four_vectors<D> rows_at(D d, const hn::TFromD<D>* table, Index index) {
  using offset = hn::TFromV<Index>;
  HWY_ALIGN offset at[HWY_MAX_BYTES / sizeof(offset)];
  hn::Store(index, hn::DFromV<Index>(), at);
  if constexpr (sizeof(offset) == 4) {
    const hn::Repartition<double, D> pairs;
    const auto row0 = blocks_at<4>(d, table, at), row1 = blocks_at<4>(d, table, at + 1);
    const auto row2 = blocks_at<4>(d, table, at + 2), row3 = blocks_at<4>(d, table, at + 3);
    const auto low01 = hn::BitCast(pairs, hn::InterleaveLower(d, row0, row1));
    const auto low23 = hn::BitCast(pairs, hn::InterleaveLower(d, row2, row3));
    const auto high01 = hn::BitCast(pairs, hn::InterleaveUpper(d, row0, row1));
    const auto high23 = hn::BitCast(pairs, hn::InterleaveUpper(d, row2, row3));
    return {hn::BitCast(d, hn::InterleaveLower(pairs, low01, low23)),
            hn::BitCast(d, hn::InterleaveUpper(pairs, low01, low23)),
            hn::BitCast(d, hn::InterleaveLower(pairs, high01, high23)),
            hn::BitCast(d, hn::InterleaveUpper(pairs, high01, high23))};
  } else {
    const auto front0 = blocks_at<2>(d, table, at), front1 = blocks_at<2>(d, table, at + 1);
    const auto back0 = blocks_at<2>(d, table + 2, at), back1 = blocks_at<2>(d, table + 2, at + 1);
    return {hn::InterleaveLower(d, front0, front1), hn::InterleaveUpper(d, front0, front1),
            hn::InterleaveLower(d, back0, back1), hn::InterleaveUpper(d, back0, back1)};
  }
}

#endif

// ((c_3 x + c_2) x + c_1) x + c_0.
template <class D>
HWY_INLINE hn::Vec<D> cubic(D d, hn::Vec<D> c0, hn::Vec<D> c1, hn::Vec<D> c2, hn::Vec<D> c3,
                            hn::Vec<D> x) {
  return fused(d, fused(d, fused(d, c3, x, c2), x, c1), x, c0);
}

// p x, or the end for x = +-1.
template <class D>
HWY_INLINE hn::Vec<D> times_or_end(D d, hn::Vec<D> p, hn::Vec<D> x, hn::TFromD<D> end) {
  const auto at_end = hn::Ge(hn::Abs(x), hn::Set(d, 1));
  return hn::IfThenElse(at_end, hn::CopySignToAbs(hn::Set(d, end), x), hn::Mul(p, x));
}

// For |x| <= 1. t is kept within the table: x = +-1 has a value of its own, and t = 1 means an x
// below half a unit in the last place of 1.
HWY_INLINE float_vector vector_erfinv(float_vector x) {
  namespace table = erfinv_tables;
  const hn::ScalableTag<float> d;
  const hn::RebindToSigned<decltype(d)> di;
  constexpr int shift = table::float_segment_shift;
  const auto rest = hn::Max(hn::Sub(hn::Set(d, 1), hn::Abs(x)), hn::Set(d, 0x1p-24f));
  const auto t = hn::BitCast(di, hn::Min(rest, hn::Set(d, 0x1.fffffep-1f)));
  const auto row = hn::Sub(hn::Set(di, table::float_first_segment), hn::ShiftRight<shift>(t));
  const auto mantissa = hn::And(t, hn::Set(di, (1 << shift) - 1));
  const auto m = hn::BitCast(d, hn::Or(mantissa, hn::BitCast(di, hn::Set(d, 1))));
  const auto r = hn::Sub(m, hn::Set(d, table::float_center));
  const auto [c0, c1, c2, c3] = rows_at(d, table::float_rows[0], hn::ShiftLeft<2>(row));
  return times_or_end(d, cubic(d, c0, c1, c2, c3, r), x, table::float_end);
}

HWY_INLINE double_vector vector_erfinv(double_vector x) {
  namespace table = erfinv_tables;
  const hn::ScalableTag<double> d;
  const hn::RebindToSigned<decltype(d)> di;
  constexpr int shift = table::double_segment_shift;
  const auto rest = hn::Max(hn::Sub(hn::Set(d, 1), hn::Abs(x)), hn::Set(d, 0x1p-53));
  const auto t = hn::BitCast(di, rest);
  const auto segment = hn::ShiftRight<shift>(t);
  const auto row = hn::Sub(segment, hn::Set(di, table::double_first_segment));
  const auto middle = hn::Or(hn::ShiftLeft<shift>(segment), hn::Set(di, table::double_middle));
  const auto distance = hn::Sub(rest, hn::BitCast(d, middle));
  const auto [c3, c2, c1, c0] = rows_at(d, table::double_rows[0], hn::ShiftLeft<2>(row));
  return times_or_end(d, cubic(d, c0, c1, c2, c3, distance), x, table::double_end);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif  // per target
