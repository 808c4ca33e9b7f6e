// SPDX-License-Identifier: Apache-2.0
// Reduction of a basis of two vectors (Lagrange, Gauss).
#include "spectral.hpp"

#include <cmath>
#include <utility>

namespace {

__extension__ using int128 = __int128;

struct vector {
  int128 x, y;
};

// Coordinates start below 2^97, so that their products need rounding; quotients from rounded ones
// shorten a vector a little less, and the loop below repeats until none is left.
long double dot(vector a, vector b) {
  return static_cast<long double>(a.x) * static_cast<long double>(b.x) +
         static_cast<long double>(a.y) * static_cast<long double>(b.y);
}

}  // namespace

uint128 least_distance_squared(uint128 multiplier, uint128 modulus) {
  vector longer{0, static_cast<int128>(modulus)}, shorter{1, static_cast<int128>(multiplier)};
  for (;;) {
    if (dot(longer, longer) < dot(shorter, shorter))
      std::swap(longer, shorter);
    const auto times = static_cast<int128>(roundl(dot(longer, shorter) / dot(shorter, shorter)));
    if (times == 0)
      break;
    longer.x -= times * shorter.x;
    longer.y -= times * shorter.y;
  }
  // The reduced vector is no longer than about 2^48.6: its square is exact.
  return static_cast<uint128>(shorter.x * shorter.x + shorter.y * shorter.y);
}
