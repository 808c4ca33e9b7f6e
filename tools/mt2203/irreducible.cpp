// SPDX-License-Identifier: Apache-2.0
// See irreducible.hpp. t^(2^k) - t is the product of all irreducible polynomials whose degree
// divides k. The degree 2203 is a prime, hence: f without linear factors is irreducible if and only
// if f divides t^(2^2203) - t.
#include "irreducible.hpp"

#include "characteristic.hpp"
#include "gf2.hpp"

namespace tarn::mt2203 {

namespace {

constexpr int early = 96;  // about where the search is fastest; any value gives the same answers

}  // namespace

bool irreducible(std::uint32_t a) {
  // f(0) = f(1) = bit 31 of a: no linear factor if it is set, both if not.
  if (a >> 31 == 0)
    return false;
  const gf2::polynomial f = characteristic_polynomial(a);
  const gf2::modulus modulo(f);
  const gf2::polynomial t = gf2::monomial(1);

  // Factors of degree up to 96: each such degree divides one of 49..96.
  gf2::polynomial power = t;
  gf2::polynomial together = gf2::monomial(0);
  for (int k = 1; k <= early; ++k) {
    power = modulo.square(power);
    if (k > early / 2)
      together = modulo.multiply(together, power + t);
  }
  if (!coprime(f, together))
    return false;

  for (int k = early + 1; k <= gf2::degree; ++k)
    power = modulo.square(power);
  return power == t;
}

}  // namespace tarn::mt2203
