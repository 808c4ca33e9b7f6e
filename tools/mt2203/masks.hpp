// SPDX-License-Identifier: Apache-2.0
// Search for the two tempering masks that belong to a matrix word.
#pragma once

#include "equidistribution.hpp"
#include "twister.hpp"

namespace tarn::mt2203 {

struct tempered {
  parameters member;
  equidistribution quality;
};

// Masks for `a`, which must give the full period; the same ones on every call. Bits that the
// shifts leave without effect are 0.
tempered find_masks(std::uint32_t a);

}  // namespace tarn::mt2203
