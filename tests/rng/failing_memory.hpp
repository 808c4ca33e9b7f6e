// SPDX-License-Identifier: Apache-2.0
// Allocations of the whole program, counted and made to fail: operator new, from which the
// random-number library and the SYCL runtime take their memory, and tarn_serv_malloc, from which
// streams come. A program that links failing_memory.cpp has both replaced.
#pragma once

#include <cstdint>

namespace tarn_test {

/// Blocks of all threads that have not been given back.
std::int64_t live_blocks();

enum class failing { one, all_from_there };

/// While it lives, the `number`-th allocation of this thread fails, or all from there on.
class failing_memory {
 public:
  failing_memory(int number, failing which);
  failing_memory(const failing_memory&) = delete;
  failing_memory& operator=(const failing_memory&) = delete;
  ~failing_memory();

  /// Whether an allocation has failed. Remains true after the end of the failures.
  bool happened() const;
  /// Lets all allocations pass again.
  void end();
};

}  // namespace tarn_test
