// SPDX-License-Identifier: Apache-2.0
// Products of polynomials over GF(2), in two ways that give the same: with the processor's
// carry-less multiplication, or with shifts and exclusive ors.
#pragma once

#include "gf2.hpp"

namespace tarn::mt2203::gf2 {

struct multiplier {
  // Writes the words [first, last) of x * y; what `out` holds elsewhere is not defined afterwards.
  void (*multiply)(const polynomial& x, const polynomial& y, int first, int last, product& out);
  void (*square)(const polynomial& x, product& out);
};

extern const multiplier carryless_multiplier;  // only where carryless_available()
extern const multiplier portable_multiplier;

bool carryless_available();

// The way that all arithmetic takes: carry-less if the processor has it and nobody forced the
// other one. To be forced before threads start.
const multiplier& chosen_multiplier();
void force_portable_multiplier();

}  // namespace tarn::mt2203::gf2
