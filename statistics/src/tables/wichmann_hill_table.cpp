// SPDX-License-Identifier: Apache-2.0
// The rows of the table, which `./run tables` generates.
#include "tables/wichmann_hill_table.hpp"

namespace tarn::statistics {

const wichmann_hill_constants wichmann_hill_table[wichmann_hill_members] = {
#include "tables/wichmann_hill_table.inc"
};

}  // namespace tarn::statistics
