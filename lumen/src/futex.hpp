// SPDX-License-Identifier: Apache-2.0
// Sleeping on a 32-bit word until another thread changes and wakes it (Linux futex).
#pragma once

#include <atomic>
#include <cstdint>
#include <unistd.h>

#include <linux/futex.h>
#include <sys/syscall.h>

#include "sycl/detail/config.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

static_assert(sizeof(std::atomic<std::uint32_t>) == 4, "the kernel looks at four bytes");

// Returns when woken, or at once when the word is not `expected`; may return for no reason.
inline void futex_wait(std::atomic<std::uint32_t>& word, std::uint32_t expected) noexcept {
  syscall(SYS_futex, &word, FUTEX_WAIT_PRIVATE, expected, nullptr, nullptr, 0);
}
inline void futex_wake_all(std::atomic<std::uint32_t>& word) noexcept {
  syscall(SYS_futex, &word, FUTEX_WAKE_PRIVATE, 0x7fffffff, nullptr, nullptr, 0);
}

}  // namespace detail
LUMEN_NAMESPACE_END
