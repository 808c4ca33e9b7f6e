// SPDX-License-Identifier: Apache-2.0
// Runtimes that may be missing, so that nothing is linked to them: a table of entry points that is
// filled when one of them is first called. The library is loaded, the names are looked up one by
// one in a fixed order, and the outcome is remembered for good.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <type_traits>

namespace kestrel::tarn::gpu {

/// Leaves not_tried once.
enum class binding_state : std::int32_t { not_tried = 0, bound = 1, failed = -1 };

/// What is known of one runtime.
struct binding_record {
  const char* library;            // as the dynamic loader knows it
  const char* const* names;       // of the entry points, in binding order
  std::atomic<void*>* functions;  // of these names; null until found, then valid for good
  std::size_t size;
  std::atomic<binding_state> state{binding_state::not_tried};
  int lock = 0;  // of binders that take one
};

/// Looks up the names from `first` up to `last`, not included, and stops at the first one that
/// `module` lacks: its index is the result, otherwise `last`. A null module has none.
std::size_t look_up(binding_record& record, void* module, std::size_t first, std::size_t last);

/// Binds under the record's lock, with the library of load_native_library, and says nothing.
/// \returns 0, or -1 if the library or one of the names is missing
int bind_under_lock(binding_record& record);

/// What binders return: 0 if bound, otherwise -1.
inline int binding_result(binding_state state) {
  return state == binding_state::bound ? 0 : -1;
}

/// Prints that no library has the function, and ends the process with status 2, unless an exit hook
/// keeps it alive.
void end_for_missing_function(const char* name);

/// The way to the entry point number `index` of a runtime, which has its `record`, the array
/// `functions` of the record, `bind`, and the `unbound_result` of calls to a missing entry point
/// that an exit hook has survived. `Pointer` points to functions of the entry's type.
template <class Runtime, std::size_t index, class Pointer>
struct bound_function;

template <class Runtime, std::size_t index, class Result, class... Argument>
struct bound_function<Runtime, index, Result (*)(Argument...)> {
  using pointer = Result (*)(Argument...);

  static Result call(Argument... arguments) {
    pointer function = look();
    if (function == nullptr) {
      Runtime::bind();
      function = look();
    }
    if (function == nullptr) {
      end_for_missing_function(Runtime::record.names[index]);
      return unbound();
    }
    return function(arguments...);
  }

 private:
  // Acquire, so that what the loading of the library stored is seen before its code runs.
  static pointer look() {
    return reinterpret_cast<pointer>(Runtime::functions[index].load(std::memory_order_acquire));
  }

  static Result unbound() {
    if constexpr (std::is_pointer_v<Result>) {
      return reinterpret_cast<Result>(Runtime::unbound_result);
    } else {
      return static_cast<Result>(Runtime::unbound_result);
    }
  }
};

}  // namespace kestrel::tarn::gpu
