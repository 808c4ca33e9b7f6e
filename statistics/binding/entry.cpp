// SPDX-License-Identifier: Apache-2.0
// Finding the statistics library and its entries.
#include "entry.hpp"

#include "tarn_serv.h"

namespace tarn::rvx {

namespace {

constexpr int no_library_message = 771;
constexpr int no_entry_message = 772;
constexpr int exit_status = 2;
constexpr int standard_error = 1;

std::atomic<void*> module{nullptr};

void* find_module() {
  void* found = module.load(std::memory_order_relaxed);
  if (found == nullptr) {
    found = tarn_serv_load_vlx();
    module.store(found, std::memory_order_relaxed);
  }
  return found;
}

}  // namespace

void* find_entry(const char* name) {
  void* library = find_module();
  if (library == nullptr) {
    tarn_serv_print(standard_error, no_library_message, 0);
    tarn_serv_exit(exit_status);
    return nullptr;
  }
  void* found = tarn_serv_find_symbol(library, name);
  if (found == nullptr) {
    tarn_serv_print(standard_error, no_entry_message, 1, name);
    tarn_serv_exit(exit_status);
  }
  return found;
}

}  // namespace tarn::rvx
