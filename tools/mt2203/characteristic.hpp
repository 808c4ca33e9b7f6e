// SPDX-License-Identifier: Apache-2.0
// The characteristic polynomial of a twister's recurrence. With P = t^69 + t^34, Q = t^68 + t^33
// and a_i the bit i of `a`, it is
//   f = P^27 Q^5 + sum over i = 0..4 of a_i P^27 Q^(4-i) + sum over i = 5..31 of a_i P^(31-i)
// (Matsumoto and Nishimura, "Mersenne Twister", ACM TOMACS 8(1), 1998, appendix A). So f is a sum
// of some of 33 fixed terms. Their degrees differ: different `a` have different f.
#pragma once

#include <array>

#include "gf2.hpp"
#include "twister.hpp"

namespace tarn::mt2203 {

// The terms, in whatever ring 1, P and Q are given: terms[i] belongs to a_i, terms[32] is the one
// that is always there.
template <class Element, class Multiply>
std::array<Element, 33> characteristic_terms(const Element& one, const Element& p, const Element& q,
                                             Multiply multiply) {
  constexpr int lower_bits = mt2203_shape.lower_bits;
  std::array<Element, 33> terms{};
  Element power = one;
  for (int i = 31; i >= lower_bits; --i) {
    terms[static_cast<std::size_t>(i)] = power;
    power = multiply(power, p);
  }
  for (int i = lower_bits - 1; i >= 0; --i) {
    terms[static_cast<std::size_t>(i)] = power;
    power = multiply(power, q);
  }
  terms[32] = power;
  return terms;
}

gf2::polynomial characteristic_polynomial(std::uint32_t a);

}  // namespace tarn::mt2203
