// SPDX-License-Identifier: Apache-2.0
// Level Zero, bound at first use: its functions under their plain names in namespace ze. What other
// libraries may call, tarn_level_zero.h declares.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>

#include <level_zero/ze_api.h>

#include "late_binding.hpp"

namespace kestrel::tarn::gpu {

/// Loads Level Zero, calls zeInit(0) and looks up the other entry points, the first time that it is
/// called; what fails is told on standard error. It takes no lock: threads that come first at the
/// same time may all do this, and each print a line, but what they store is the same.
/// \returns 0, or -1 if the library or one of the names is missing or zeInit fails; always the same
int bind_level_zero();

enum class level_zero_function : std::size_t {
#define TARN_LEVEL_ZERO_FUNCTION(name) name,
#include "level_zero_functions.def"
  count
};

struct level_zero_runtime {
  static constexpr std::size_t size = static_cast<std::size_t>(level_zero_function::count);
  static constexpr std::intptr_t unbound_result = ZE_RESULT_ERROR_NOT_AVAILABLE;
  static constexpr auto bind = bind_level_zero;
  static std::atomic<void*> functions[size];
  static binding_record record;
};

/// Pointers to the functions. A call of one that cannot be bound prints its name and ends the
/// process with status 2; if an exit hook keeps the process alive, the call gives back 0x70010001.
namespace ze {

#define TARN_LEVEL_ZERO_FUNCTION(name)                                                         \
  inline constexpr decltype(&::name) name =                                                    \
      &bound_function<level_zero_runtime, static_cast<std::size_t>(level_zero_function::name), \
                      decltype(&::name)>::call;
#include "level_zero_functions.def"

}  // namespace ze

}  // namespace kestrel::tarn::gpu
