// SPDX-License-Identifier: Apache-2.0
// Which methods and parameters a routine can have. Each function gives the position, among the
// arguments of its routine, of the first one that it cannot, or 0. Shared by the plain names, which
// report the position, and the raw entries, which only refuse.
#pragma once

#include <cstdint>

namespace tarn::statistics::parameters {

// Bits that a method code may have.
inline constexpr int accuracy_methods = 0x40000000;
inline constexpr int any_method = 0x7FFFFFFF;  // routines with a single method take any code

inline constexpr int good = 0;

// Pairs of a condition and a position, looked at in order.
inline int first_bad() {
  return good;
}
template <class... Rest>
int first_bad(bool holds, int position, Rest... rest) {
  return holds ? first_bad(rest...) : position;
}

// Also true for bounds that are not numbers.
template <class Value>
int uniform(Value a, Value b) {
  return a < b ? good : 5;
}

}  // namespace tarn::statistics::parameters
