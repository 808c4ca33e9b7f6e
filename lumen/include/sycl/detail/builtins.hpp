// SPDX-License-Identifier: Apache-2.0
// The built-in functions of SYCL 2020, section 4.17.
#pragma once

#include "builtins_common.hpp"
#include "builtins_geometric.hpp"
#include "builtins_integer.hpp"
#include "builtins_math.hpp"
#include "builtins_native.hpp"
#include "builtins_relational.hpp"
#include "builtins_split.hpp"

#undef LUMEN_SCALAR_1
#undef LUMEN_SCALAR_2
#undef LUMEN_SCALAR_3
#undef LUMEN_LIFT_1
#undef LUMEN_LIFT_2
#undef LUMEN_LIFT_3
#undef LUMEN_LIFT_2_SCALAR
#undef LUMEN_LIFT_2_INT
#undef LUMEN_REAL_1
#undef LUMEN_REAL_2
#undef LUMEN_REAL_3
