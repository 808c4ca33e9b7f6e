// SPDX-License-Identifier: Apache-2.0
// The rows of the table, which `./run tables` generates.
#include "tables/mt2203_table.hpp"

namespace tarn::statistics {

const mt2203_parameters mt2203_table[mt2203_members] = {
#include "tables/mt2203_table.inc"
};

}  // namespace tarn::statistics
