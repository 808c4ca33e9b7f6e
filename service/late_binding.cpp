// SPDX-License-Identifier: Apache-2.0
// What the bindings of all runtimes share.
#include "late_binding.hpp"

#include <cstdio>
#include <tarn_serv.h>

#include "native_library.hpp"

namespace kestrel::tarn::gpu {

std::size_t look_up(binding_record& record, void* module, std::size_t first, std::size_t last) {
  for (std::size_t i = first; i < last; ++i) {
    void* const function = tarn_serv_find_symbol(module, record.names[i]);
    if (function == nullptr) {
      return i;
    }
    record.functions[i].store(function, std::memory_order_release);
  }
  return last;
}

int bind_under_lock(binding_record& record) {
  tarn_serv_lock(&record.lock);
  if (record.state.load(std::memory_order_relaxed) == binding_state::not_tried) {
    void* const module = load_native_library(record.library);
    const bool complete = look_up(record, module, 0, record.size) == record.size;
    record.state.store(complete ? binding_state::bound : binding_state::failed,
                       std::memory_order_relaxed);
  }
  tarn_serv_unlock(&record.lock);
  return binding_result(record.state.load(std::memory_order_relaxed));
}

void end_for_missing_function(const char* name) {
  constexpr int standard_output = 0;
  constexpr int missing_function_message = 3;
  constexpr int exit_status = 2;
  char quoted[64];  // the longest name has 40 characters
  std::snprintf(quoted, sizeof quoted, "'%s'", name);
  tarn_serv_print(standard_output, missing_function_message, 1, quoted);
  tarn_serv_exit(exit_status);
}

}  // namespace kestrel::tarn::gpu
