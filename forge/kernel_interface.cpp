// SPDX-License-Identifier: Apache-2.0
// Declaring arguments and placing them in registers.
#include "kernel_interface.hpp"

#include <algorithm>
#include <cstddef>

#include "exceptions.hpp"

namespace kestrel::tarn::forge {
namespace {

constexpr const char* local_size_names[] = {"__local_size0", "__local_size1", "__local_size2"};

const kernel_argument& find(const std::vector<kernel_argument>& arguments,
                            const std::string& name) {
  const auto found =
      std::find_if(arguments.begin(), arguments.end(),
                   [&name](const kernel_argument& argument) { return argument.name == name; });
  if (found == arguments.end()) {
    throw unknown_argument_exception();
  }
  return *found;
}

kernel_argument hidden_argument(const char* name, argument_type type) {
  kernel_argument argument;
  argument.name = name;
  argument.type = type;
  argument.kind = argument_kind::hidden;
  return argument;
}

constexpr std::int32_t round_up(std::int32_t value, std::int32_t step) {
  return (value + step - 1) / step * step;
}

/// The next free byte of the registers that the caller fills.
class register_cursor {
 public:
  register_cursor(std::int32_t first, std::int32_t register_size)
      : number_{first}, register_size_{register_size} {}

  void place(kernel_argument& argument) {
    const std::int32_t size = size_of(argument.type);
    const bool block = is_local_size_block(argument);
    if (block && register_size_ - byte_ < local_size_block_bytes) {
      next_register();
    }
    byte_ = round_up(byte_, std::max(size, 4));
    if (byte_ >= register_size_) {
      next_register();
    }
    argument.location = register_location(number_, byte_ / size, argument.type);
    byte_ += block ? local_size_block_bytes : size;
  }

  /// Bytes from the first register on, in whole 32 bytes.
  std::uint32_t bytes_from(std::int32_t first) const {
    return static_cast<std::uint32_t>(round_up(byte_, 32) + (number_ - first) * register_size_);
  }

 private:
  void next_register() {
    ++number_;
    byte_ = 0;
  }

  std::int32_t number_;
  std::int32_t byte_ = 0;
  std::int32_t register_size_;
};

void place_all(std::vector<kernel_argument>& arguments, argument_kind kind,
               register_cursor& cursor) {
  for (kernel_argument& argument : arguments) {
    if (argument.kind == kind && !argument.location.is_assigned()) {
      cursor.place(argument);
    }
  }
}

}  // namespace

bool is_local_size_block(const kernel_argument& argument) {
  return argument.kind == argument_kind::hidden && argument.name == local_size_names[0];
}

kernel_interface::kernel_interface(hw_code generation)
    : hw{generation},
      simd{generation < hw_pine ? 8 : 16},
      inline_data_registers{generation == hw_oak || generation == hw_yew} {}

void kernel_interface::new_argument(const std::string& name, argument_type type) {
  new_argument(name, type, argument_kind::scalar, 0);
}

void kernel_interface::new_argument(const std::string& name, argument_type type, argument_kind kind,
                                    std::int32_t access) {
  kernel_argument argument;
  argument.name = name;
  argument.type = type;
  argument.kind = kind;
  if (kind == argument_kind::global_pointer) {
    const std::int32_t usual = hw < hw_pine ? stateless_access | surface_access : stateless_access;
    argument.access = access == default_access ? usual : access;
  }
  if (has_access(argument, surface_access)) {
    argument.surface = static_cast<std::int32_t>(std::count_if(
        arguments.begin(), arguments.end(),
        [](const kernel_argument& other) { return has_access(other, surface_access); }));
  }
  argument.index = static_cast<std::int32_t>(next_index++);
  arguments.push_back(argument);
}

std::int32_t kernel_interface::first_free_register() const {
  if (need_local_id) {
    return simd == 1 ? 2 : 1 + 3 * registers_per_local_id();
  }
  return hw < hw_oak ? 2 : 1;
}

void kernel_interface::finalize() {
  if (finalized) {
    return;
  }
  const std::int32_t base = first_free_register();
  register_cursor cursor(base, register_size());
  place_all(arguments, argument_kind::local_pointer, cursor);
  place_all(arguments, argument_kind::global_pointer, cursor);
  place_all(arguments, argument_kind::scalar, cursor);
  if (scratch_size != 0) {
    arguments.push_back(hidden_argument("__scratch_size", type_ulong));
  }
  if (need_local_size && use_enqueued_local_size) {
    for (const char* const name : local_size_names) {
      arguments.push_back(hidden_argument(name, type_uint));
    }
  }
  place_all(arguments, argument_kind::hidden, cursor);
  cross_thread_bytes = cursor.bytes_from(base);
  const std::uint32_t header = hw < hw_pine ? 0 : 32;
  const auto register_bytes = static_cast<std::uint32_t>(register_size());
  cross_thread_registers = (cross_thread_bytes + header + 31) / register_bytes;
  if (need_local_size && !use_enqueued_local_size) {
    // The thread's header delivers these, so they take no space from the others.
    for (std::int32_t dimension = 0; dimension < 3; ++dimension) {
      kernel_argument size = hidden_argument(local_size_names[dimension], type_uint);
      size.location = register_location(base, 3 + dimension, type_uint);
      arguments.push_back(size);
    }
  }
  finalized = true;
}

register_location kernel_interface::get_argument(const std::string& name) const {
  return find(arguments, name).location;
}

std::int32_t kernel_interface::get_surface(const std::string& name) const {
  return find(arguments, name).surface;
}

register_location kernel_interface::get_local_id(std::int32_t dimension) const {
  if (!need_local_id || dimension < 0 || dimension > 2) {
    throw unknown_argument_exception();
  }
  if (simd == 1) {
    return register_location(1, dimension,
                             type_ushort);  // packed into one register
  }
  return register_location(1 + dimension * registers_per_local_id(), 0, type_ushort);
}

register_location kernel_interface::get_local_size(std::int32_t dimension) const {
  if (dimension < 0 || dimension > 2) {
    throw unknown_argument_exception();
  }
  return get_argument(local_size_names[dimension]);
}

bool kernel_interface::has_work_group_size() const {
  return std::all_of(work_group_size.begin(), work_group_size.end(),
                     [](std::uint64_t size) { return size != 0; });
}

void kernel_interface::require_finalized() const {
  if (!finalized) {
    throw interface_not_finalized();
  }
  if (location_overridden) {
    throw unsupported_argument_location_override();
  }
}

}  // namespace kestrel::tarn::forge
