// SPDX-License-Identifier: Apache-2.0
// What the device level does not look at by itself.
#include "generator.hpp"

#include <limits>

#include <kestrel/tarn/exceptions.hpp>

namespace kestrel::tarn::rng::detail::openmp {

void check_results(std::int64_t n, std::int64_t values, const void* r) {
  if (n < 0 || n > std::numeric_limits<std::int64_t>::max() / values) {
    throw invalid_argument("rng", "generate", "n");
  }
  if (n > 0 && r == nullptr) {
    throw invalid_argument("rng", "generate", "r");
  }
}

}  // namespace kestrel::tarn::rng::detail::openmp
