// SPDX-License-Identifier: Apache-2.0
// Layout of the tables of erfinv(x) / x: cubics in segments of t = 1 - |x|. A segment is an
// exponent of t and the first bits of its mantissa, so that integer operations on the bits of t
// find the row.
#pragma once

#include <cstdint>

namespace tarn::statistics::erfinv_tables {

// Float: eight segments in each octave of t, from [0.9375, 1) down to t = 2^-24. Bits 20 and
// higher of t tell the segment; with m the rest of its mantissa as a number of [1, 1.125), the
// cubic c0 + c1 r + c2 r^2 + c3 r^3 is one in r = m - 1.0625.
inline constexpr int float_segment_shift = 20;
inline constexpr std::int32_t float_first_segment = 0x3F7;  // of row 0; segments descend
inline constexpr float float_center = 1.0625f;
inline constexpr int float_row_count = 192;

// Double: sixteen segments in each octave, from 2^-53 up to [1, 1.0625), of which t = 1 is used.
// Bits 48 and higher of t tell the segment, whose middle has bit 47 set and none below; the cubic
// ((A d + B) d + C) d + D is one in d = t - middle.
inline constexpr int double_segment_shift = 48;
inline constexpr std::int64_t double_first_segment = 0x3CA0;  // of row 0; segments ascend
inline constexpr std::int64_t double_middle = std::int64_t{1} << 47;
inline constexpr int double_row_count = 849;

// What stands for erfinv(1), which is infinite: the value next to it.
inline constexpr float float_end = 0x1.EA8F96p1f;          // 3.8325069
inline constexpr double double_end = 0x1.7744F8F74E94Ap2;  // 5.8635847487551676

}  // namespace tarn::statistics::erfinv_tables
