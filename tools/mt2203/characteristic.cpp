// SPDX-License-Identifier: Apache-2.0
// See characteristic.hpp.
#include "characteristic.hpp"

namespace tarn::mt2203 {

gf2::polynomial characteristic_polynomial(std::uint32_t a) {
  using gf2::monomial;
  constexpr twister_shape s = mt2203_shape;
  static const auto terms =
      characteristic_terms(monomial(0), monomial(s.words) + monomial(s.middle),
                           monomial(s.words - 1) + monomial(s.middle - 1), gf2::short_multiply);
  gf2::polynomial f = terms[32];
  for (std::size_t i = 0; i < 32; ++i)
    if ((a >> i & 1) != 0)
      f = f + terms[i];
  return f;
}

}  // namespace tarn::mt2203
