// SPDX-License-Identifier: Apache-2.0
// The one clock of profiling: monotonic, in nanoseconds.
#pragma once

#include <chrono>
#include <cstdint>

#include "sycl/detail/config.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

inline std::uint64_t now_nanoseconds() {
  return static_cast<std::uint64_t>(std::chrono::duration_cast<std::chrono::nanoseconds>(
                                        std::chrono::steady_clock::now().time_since_epoch())
                                        .count());
}

}  // namespace detail
LUMEN_NAMESPACE_END
