// SPDX-License-Identifier: Apache-2.0
// Direction words of a dimension of Sobol's sequence (Sobol, USSR Comput. Math. Math. Phys. 7,
// 1967), by the recurrence of Bratley and Fox (Algorithm 659, ACM TOMS 14, 1988).
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics::sobol {

// Dimensions of the default table.
inline constexpr std::uint32_t table_dims = 3667;

// v_1, ..., v_32 from a primitive polynomial of degree 0 < s <= 32, bit i being the coefficient of
// t^i, and from the s initial numbers m_1, ..., m_s, odd and m_j < 2^j.
inline void direct(std::uint32_t polynomial, const std::uint32_t* initial, std::uint32_t v[32]) {
  unsigned degree = 0;
  for (std::uint32_t rest = polynomial >> 1; rest != 0; rest >>= 1)
    ++degree;
  for (unsigned j = 0; j < 32; ++j) {
    if (j < degree) {
      v[j] = initial[j] << (31 - j);
      continue;
    }
    v[j] = v[j - degree] ^ v[j - degree] >> degree;
    for (unsigned k = 1; k < degree; ++k)
      if ((polynomial >> (degree - k) & 1) != 0)
        v[j] ^= v[j - k];
  }
}

}  // namespace tarn::statistics::sobol
