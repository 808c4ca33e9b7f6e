// SPDX-License-Identifier: Apache-2.0
// The rule by which each member of the table is found, and what it has to meet.
#pragma once

#include <cstdint>

#include "equidistribution.hpp"
#include "sieve.hpp"
#include "twister.hpp"

namespace tarn::mt2203 {

// What every row keeps; 2203 and 1101 are the largest possible values, and k(32) is at most 68.
inline constexpr int required_k1 = 2203;
inline constexpr int required_k2 = 1101;
inline constexpr int least_k = 68;
inline constexpr int highest_defect = 800;  // 56 % of the irreducible candidates keep it

bool acceptable(const equidistribution& quality);

// The matrix words that are tried for `id`, in this order: bit 31 set, which a full period needs,
// the id in the low 16 bits, and the 15 bits between them in an order that differs between ids.
inline constexpr std::uint32_t candidates = 32768;
std::uint32_t candidate(std::uint32_t id, std::uint32_t number);

class member_finder {
 public:
  // The first candidate that has the full period and acceptable masks. Depends on the id alone.
  parameters find(std::uint32_t id) const;

 private:
  small_factor_sieve sieve_;
};

}  // namespace tarn::mt2203
