// SPDX-License-Identifier: Apache-2.0
// Rejection in blocks. A candidate takes a fixed number of words and gives one value or none. Never
// are more candidates tried than values are still missing: the last candidate of the last round is
// accepted, so that the source stands exactly behind the last word used, nothing has to be given
// back, and the values do not depend on how a sequence is cut into calls.
#pragma once

#include <algorithm>
#include <cstddef>

namespace tarn::statistics {

inline constexpr std::size_t block_candidates = 512;

// attempt(count, out) tries the next `count` candidates (at most block_candidates), writes the
// values of those accepted in their order, and gives how many there are.
template <class Value, class Attempt>
void draw_accepted(std::size_t n, Value* out, const Attempt& attempt) {
  while (n != 0) {
    const std::size_t accepted = attempt(std::min(n, block_candidates), out);
    out += accepted;
    n -= accepted;
  }
}

}  // namespace tarn::statistics
