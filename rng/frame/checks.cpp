// SPDX-License-Identifier: Apache-2.0
// The checks of a call's count and output, once for all combinations.
#include "frame/checks.hpp"

#include <algorithm>
#include <cstddef>
#include <cstdint>

namespace kestrel::tarn::rng::detail {

void check_output(std::int64_t n, const void* r) {
  if (n < 0) {
    throw invalid_argument("rng", "generate", "n");
  }
  if (r == nullptr) {
    throw invalid_argument("rng", "generate", "r");
  }
}

void check_output(std::int64_t n, std::size_t buffer_size, std::int64_t values) {
  // Divided, not multiplied: n * values may not fit. A buffer smaller than n is always too small.
  const auto holds = static_cast<std::int64_t>(buffer_size);
  if (n < 0 || n > holds / std::max<std::int64_t>(values, 1)) {
    throw invalid_argument("rng", "generate", "n");
  }
}

}  // namespace kestrel::tarn::rng::detail
