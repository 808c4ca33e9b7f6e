// SPDX-License-Identifier: Apache-2.0
// Whether a twister has the period 2^2203 - 1: proof by powers of t modulo its characteristic
// polynomial.
#pragma once

#include <cstdint>

namespace tarn::mt2203 {

// The characteristic polynomial of `a` is irreducible; it is primitive then, because 2^2203 - 1 is
// a prime, and every non-zero state has that period.
bool irreducible(std::uint32_t a);

}  // namespace tarn::mt2203
