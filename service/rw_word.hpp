// SPDX-License-Identifier: Apache-2.0
// A lock of one 32-bit word for tables that are read often and written once for each entry: bit 0
// is the writer's, and each reader counts 2. Whoever has to wait spins, so nothing may be held that
// takes long. Writers wait for all readers; a stream of readers can keep a writer out.
#pragma once

#include <atomic>
#include <cstdint>
#include <thread>

namespace kestrel::tarn::gpu {

/// Meets the requirements of std::shared_lock and std::lock_guard. Not recursive; a reader gives
/// its hold up before it takes the writer's side.
class rw_word {
 public:
  void lock_shared() {
    word_.fetch_add(reader, std::memory_order_relaxed);
    while ((word_.load(std::memory_order_acquire) & writer) != 0) {
      std::this_thread::yield();
    }
  }
  void unlock_shared() { word_.fetch_sub(reader, std::memory_order_release); }

  void lock() {
    for (std::uint32_t expected = 0; !word_.compare_exchange_weak(
             expected, writer, std::memory_order_acquire, std::memory_order_relaxed);
         expected = 0) {
      std::this_thread::yield();
    }
  }
  /// Clears its bit only: readers that wait stand counted in the others.
  void unlock() { word_.fetch_and(~writer, std::memory_order_release); }

 private:
  static constexpr std::uint32_t writer = 1;
  static constexpr std::uint32_t reader = 2;

  std::atomic<std::uint32_t> word_{0};
};

}  // namespace kestrel::tarn::gpu
