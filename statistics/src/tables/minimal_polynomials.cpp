// SPDX-License-Identifier: Apache-2.0
// The polynomials, which `./run tables` generates.
#include "tables/minimal_polynomials.hpp"

namespace tarn::statistics {

#include "tables/minimal_polynomials.inc"

}  // namespace tarn::statistics
