// SPDX-License-Identifier: Apache-2.0
// Entries of the statistics library, found by name at first use. A slot is written without a lock:
// two threads that race write the same value.
#pragma once

#include <atomic>

#include "tarn_rvx.h"

namespace tarn::rvx {

// The address of the entry `name`. If the library or the entry is missing, prints why and ends the
// process with status 2; gives null only if an exit hook keeps the process alive.
void* find_entry(const char* name);

template <class Function>
class entry {
 public:
  constexpr explicit entry(const char* name) : name_(name) {}

  // The entry's status, or RVX_STATUS_NO_ENTRY.
  template <class... Argument>
  int operator()(Argument... argument) {
    void* found = slot_.load(std::memory_order_relaxed);
    if (found == nullptr) {
      found = find_entry(name_);
      if (found == nullptr)
        return RVX_STATUS_NO_ENTRY;
      slot_.store(found, std::memory_order_relaxed);
    }
    return reinterpret_cast<Function*>(found)(argument...);
  }

 private:
  const char* name_;
  std::atomic<void*> slot_{nullptr};
};

}  // namespace tarn::rvx
