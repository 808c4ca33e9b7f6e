// SPDX-License-Identifier: Apache-2.0
// See member.hpp.
#include "member.hpp"

#include <algorithm>
#include <stdexcept>
#include <string>

#include "irreducible.hpp"
#include "masks.hpp"

namespace tarn::mt2203 {

bool acceptable(const equidistribution& quality) {
  return quality.k[1] == required_k1 && quality.k[2] == required_k2 &&
         *std::min_element(quality.k.begin() + 1, quality.k.end()) >= least_k &&
         quality.defect <= highest_defect;
}

// Steps by an odd number (near 2^15 over the golden ratio) from a place that the id is hashed to.
std::uint32_t candidate(std::uint32_t id, std::uint32_t number) {
  const std::uint32_t start = id * 0x9E3779B1u >> 17;
  const std::uint32_t middle = (start + number * 20253) % candidates;
  return 0x80000000u | middle << 16 | id;
}

parameters member_finder::find(std::uint32_t id) const {
  for (std::uint32_t number = 0; number < candidates; ++number) {
    const std::uint32_t a = candidate(id, number);
    if (!sieve_.passes(a) || !irreducible(a))
      continue;
    const tempered found = find_masks(a);
    if (acceptable(found.quality))
      return found.member;
  }
  throw std::runtime_error("no parameters for member " + std::to_string(id));
}

}  // namespace tarn::mt2203
