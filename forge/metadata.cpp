// SPDX-License-Identifier: Apache-2.0
// The metadata of the newer binary format, YAML text. Numbers are turned into text here, since
// neither the flags nor the locale of the stream may change a byte.
#include <algorithm>
#include <iterator>
#include <ostream>
#include <string>

#include "exceptions.hpp"
#include "kernel_interface.hpp"

namespace kestrel::tarn::forge {
namespace {

using std::to_string;

constexpr const char* version = "1.8";
constexpr const char* scheduling_names[] = {"age_based", "round_robin", "round_robin_stall"};

template <typename Value>
std::string setting(const char* name, Value value) {
  return "      " + std::string(name) + ": " + to_string(value) + "\n";
}

template <typename Value>
std::string setting_if(bool wanted, const char* name, Value value) {
  return wanted ? setting(name, value) : "";
}

std::string flag(bool set, const char* name) {
  return set ? "      " + std::string(name) + ": true\n" : "";
}

template <typename Value>
std::string list(const char* name, Value first, Value second, Value third) {
  std::string text = "      " + std::string(name) + ":\n";
  for (const Value value : {first, second, third}) {
    text += "        - " + to_string(value) + "\n";
  }
  return text;
}

std::string geometry(const kernel_interface& kernel) {
  std::string text = setting("grf_count", kernel.grf_count) + setting("simd_size", kernel.simd) +
                     setting_if(kernel.simd >= 2, "required_sub_group_size", kernel.simd);
  if (kernel.has_work_group_size()) {
    const auto& size = kernel.work_group_size;
    text += list("required_work_group_size", size[0], size[1], size[2]);
  }
  const auto& order = kernel.walk_order;
  if (order[0] >= 0) {
    text += list("work_group_walk_order_dimensions", order[0], order[1], std::max(order[2], 0));
  }
  return text;
}

// The hardware counts barriers in powers of two.
std::int64_t barriers(std::int32_t wanted) {
  std::int64_t power = 1;
  while (power < wanted) {
    power *= 2;
  }
  return power;
}

std::string scheduling(std::int32_t mode) {
  const bool named = mode > 0 && mode <= static_cast<std::int32_t>(std::size(scheduling_names));
  return named ? "      thread_scheduling_mode: " + std::string(scheduling_names[mode - 1]) + "\n"
               : "";
}

std::string features(const kernel_interface& kernel) {
  return setting_if(kernel.skip_per_thread_offset > 0, "offset_to_skip_per_thread_data_load",
                    kernel.skip_per_thread_offset) +
         setting_if(kernel.barrier_count > 0, "barrier_count", barriers(kernel.barrier_count)) +
         flag(kernel.require_stateless_4gb, "has_4gb_buffers") + flag(kernel.use_dpas, "has_dpas") +
         flag(kernel.use_global_atomics, "has_global_atomics") +
         setting_if(kernel.slm_size != 0, "slm_size", kernel.slm_size) +
         flag(!kernel.stateless_write, "has_no_stateless_write") +
         flag(kernel.disable_preemption, "disable_mid_thread_preemption") +
         scheduling(kernel.thread_scheduling) +
         setting_if(kernel.inline_data_registers > 0, "inline_data_payload_size",
                    std::int64_t{kernel.inline_data_registers} * kernel.register_size());
}

/// Bytes from the first register that the caller fills.
std::int64_t payload_offset(const kernel_interface& kernel, const register_location& location) {
  const std::int64_t registers = std::int64_t{location.number()} - kernel.first_free_register();
  const std::int64_t offset = registers * kernel.register_size() +
                              std::int64_t{location.sub_register()} * size_of(location.type());
  if (!location.is_assigned() || offset < 0) {
    throw unsupported_argument_location_override();
  }
  return offset;
}

std::string field(const char* name, const std::string& value) {
  return "        " + std::string(name) + ": " + value + "\n";
}

std::string memory(const char* mode, const char* space) {
  return field("addrmode", mode) + field("addrspace", space) + field("access_type", "readwrite");
}

std::string surface_entry(const kernel_argument& argument) {
  return "      - arg_type: arg_bypointer\n" + field("arg_index", to_string(argument.index)) +
         field("offset", "0") + field("size", "0") + memory("stateful", "global") + "\n";
}

/// Empty for an argument that no register delivers.
std::string entry_type(const kernel_interface& kernel, const kernel_argument& argument) {
  switch (argument.kind) {
    case argument_kind::scalar:
      return "arg_byvalue";
    case argument_kind::local_pointer:
      return "arg_bypointer";
    case argument_kind::global_pointer:
      return has_access(argument, stateless_access) ? "arg_bypointer" : "";
    default:
      if (!is_local_size_block(argument)) {
        return "";
      }
      return kernel.use_enqueued_local_size ? "enqueued_local_size" : "local_size";
  }
}

std::string register_entry(const kernel_interface& kernel, const kernel_argument& argument) {
  const std::string type = entry_type(kernel, argument);
  if (type.empty()) {
    return "";
  }
  const bool block = is_local_size_block(argument);
  const std::int32_t size = block ? local_size_block_bytes : std::max(size_of(argument.type), 4);
  std::string text = "      - arg_type: " + type + "\n";
  if (!block) {
    text += field("arg_index", to_string(argument.index));
  }
  text += field("offset", to_string(payload_offset(kernel, argument.location))) +
          field("size", to_string(size));
  if (has_access(argument, stateless_access)) {
    text += memory("stateless", "global");
  }
  if (argument.kind == argument_kind::local_pointer) {
    text += memory("slm", "local");
  }
  return text + "\n";
}

std::string payload(const kernel_interface& kernel) {
  std::string text;
  for (const kernel_argument& argument : kernel.arguments) {
    if (has_access(argument, surface_access)) {
      text += surface_entry(argument);
    }
    text += register_entry(kernel, argument);
  }
  return kernel.arguments.empty() ? "" : "\n    payload_arguments: \n" + text;
}

std::string binding_table(const kernel_interface& kernel) {
  std::string text;
  for (const kernel_argument& argument : kernel.arguments) {
    if (has_access(argument, surface_access)) {
      text += "      - bti_value: " + to_string(argument.surface) + "\n" +
              field("arg_index", to_string(argument.index)) + " \n";
    }
  }
  return text.empty() ? "" : "\n    binding_table_indices: \n" + text;
}

std::string local_ids(const kernel_interface& kernel) {
  if (!kernel.need_local_id) {
    return "";
  }
  const bool packed = kernel.simd == 1;  // three values of 16 bits
  const std::int32_t size =
      packed ? 6 : 3 * kernel.registers_per_local_id() * kernel.register_size();
  return std::string("\n    per_thread_payload_arguments: \n") +
         "      - arg_type: " + (packed ? "packed_local_ids" : "local_id") + "\n" +
         field("offset", "0") + field("size", to_string(size)) + "  \n";
}

}  // namespace

void kernel_interface::emit_metadata(std::ostream& stream) const {
  require_finalized();
  const std::string text = "version: " + std::string(version) + "\nkernels: \n  - name: \"" +
                           kernel_name + "\"\n    execution_env: \n" + geometry(*this) +
                           features(*this) + payload(*this) + binding_table(*this) +
                           local_ids(*this) + "\n";
  stream.write(text.data(), static_cast<std::streamsize>(text.size()));
}

}  // namespace kestrel::tarn::forge
