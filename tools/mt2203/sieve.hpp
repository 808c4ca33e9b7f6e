// SPDX-License-Identifier: Apache-2.0
// A sieve for candidates: does the characteristic polynomial have a factor of a small degree?
// About four in five candidates have one.
#pragma once

#include <array>
#include <cstdint>
#include <vector>

namespace tarn::mt2203 {

class small_factor_sieve {
 public:
  static constexpr int highest_degree = 14;

  small_factor_sieve();

  // No irreducible polynomial of degree 2..14 divides the characteristic polynomial of `a`.
  bool passes(std::uint32_t a) const;

 private:
  // The polynomial's remainder is the sum of one entry for each byte of `a`, since it is a sum of
  // terms; the term without a bit of `a` is part of the entries of byte 0.
  using remainders = std::array<std::array<std::uint16_t, 256>, 4>;
  std::vector<remainders> factors_;
};

}  // namespace tarn::mt2203
