// SPDX-License-Identifier: Apache-2.0
// Tables of erfinv(x) / x in the layout of erfinv_layout.hpp: float_rows of c0, c1, c2, c3 and
// double_rows of A, B, C, D.
#pragma once

#include "statistics/common/erfinv_layout.hpp"

namespace tarn::statistics::erfinv_tables {

#include "statistics/common/erfinv_table.inc"

}  // namespace tarn::statistics::erfinv_tables
