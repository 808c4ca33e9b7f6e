// SPDX-License-Identifier: Apache-2.0
// What a generated kernel asks of its caller and of the device: arguments placed in registers, and
// requirements. Two texts tell the driver about it: the source of a dummy kernel in OpenCL C, whose
// compiled form is the container for code of our own in the older binary format, and the metadata
// of the newer one.
#pragma once

#include <array>
#include <cstdint>
#include <iosfwd>
#include <string>
#include <vector>

#include "hw_codes.hpp"

namespace kestrel::tarn::forge {

/// An argument's type in one byte: bits 5 to 7 are log2 of the size in bytes, bits 0 to 3 the base
/// type: 0 uint, 1 int, 2 ushort, 3 short, 4 uchar, 5 char, 6 double, 7 float, 8 ulong, 9 long, 10
/// half, 11 bits of 16 without a name of their own (ushort in sources); 12 to 15 are invalid.
using argument_type = std::uint8_t;
constexpr argument_type type_ushort = 0x22;
constexpr argument_type type_uint = 0x40;
constexpr argument_type type_ulong = 0x68;

/// In bytes.
constexpr std::int32_t size_of(argument_type type) {
  return 1 << (type >> 5);
}

enum class argument_kind : std::int32_t { scalar, global_pointer, local_pointer, hidden };

// How code reaches the memory behind a global pointer; the first two may be joined.
constexpr std::int32_t stateless_access = 1;
constexpr std::int32_t surface_access = 2;
constexpr std::int32_t default_access = 4;  // as the hardware has it

constexpr std::int32_t no_surface = 128;

/// Where a value lies: a register, the element within it, and the type that elements have. One word
/// of 64 bits: bits 0 to 7 type, 8 to 31 sub-register, 32 to 62 register; the sign bit says that
/// there is no place yet.
class register_location {
 public:
  constexpr register_location() = default;
  constexpr register_location(std::int32_t number, std::int32_t sub_register, argument_type type)
      : word_{std::int64_t{number} << 32 | std::int64_t{sub_register} << 8 | type} {}

  constexpr bool is_assigned() const { return word_ >= 0; }
  constexpr std::int32_t number() const { return static_cast<std::int32_t>(word_ >> 32); }
  constexpr std::int32_t sub_register() const {
    return static_cast<std::int32_t>(word_ >> 8 & 0xFFFFFF);
  }
  constexpr argument_type type() const { return static_cast<argument_type>(word_ & 0xFF); }

 private:
  std::int64_t word_ = -1;
};

struct kernel_argument {
  std::string name;
  argument_type type = 0;
  argument_kind kind = argument_kind::scalar;
  std::int32_t access = 0;  // of global pointers; 0 for all others
  register_location location;
  std::int32_t surface = no_surface;  // place in the binding table
  std::int32_t index = -1;  // among the arguments that a caller sets; hidden ones have none
};

/// Open to changes until finalize(); whoever places an argument by hand sets location_overridden.
/// Names go into the texts as they are: the makers of kernels answer for their being identifiers.
struct kernel_interface {
  explicit kernel_interface(hw_code generation);

  hw_code hw;
  std::vector<kernel_argument> arguments;  // in the order of declaration, hidden ones behind
  std::string kernel_name = "default_kernel";
  std::uint32_t next_index = 0;
  bool finalized = false;
  bool location_overridden = false;
  bool require_stateless_4gb = false;
  std::int32_t thread_scheduling = 0;  // 0 any, 1 age based, 2 round robin, 3 round robin stall
  std::int32_t barrier_count = 0;
  bool use_dpas = false;
  bool use_global_atomics = false;
  std::int32_t grf_count = 128;  // registers for each thread
  bool need_local_id = false;
  bool need_local_size = false;
  bool use_enqueued_local_size = false;
  bool disable_preemption = false;
  bool need_half = false;
  bool need_double = false;
  bool stateless_write = true;
  std::int32_t skip_per_thread_offset = 0;  // bytes of code that load what each thread has alone
  std::uint64_t scratch_size = 0;           // bytes
  std::int32_t simd;                        // work-items in a thread
  std::uint64_t slm_size = 0;               // bytes of shared local memory
  std::array<std::int32_t, 3> walk_order{-1, -1, -1};     // -1: any
  std::array<std::uint64_t, 3> work_group_size{0, 0, 0};  // 0: any
  std::uint32_t cross_thread_bytes = 0;                   // found by finalize(), as the next one
  std::uint32_t cross_thread_registers = 0;
  std::int32_t inline_data_registers;

  /// Declares a scalar.
  void new_argument(const std::string& name, argument_type type);

  /// `access` counts for global pointers alone: bits as above, or default_access. Those that are
  /// reached through surfaces have consecutive places in the binding table, from 0.
  void new_argument(const std::string& name, argument_type type, argument_kind kind,
                    std::int32_t access);

  /// Places in registers whatever has no place yet: local pointers, global ones, scalars, hidden
  /// arguments. Only the first call does anything.
  void finalize();

  /// Where the argument lies; without a place before finalize(). Throws unknown_argument_exception.
  register_location get_argument(const std::string& name) const;

  /// Place in the binding table, no_surface for an argument that is not reached through one. Throws
  /// unknown_argument_exception.
  std::int32_t get_surface(const std::string& name) const;

  /// Where a thread finds the local IDs of its work-items, 16 bits each, for `dimension` 0 to 2.
  /// Throws unknown_argument_exception where they were not asked for.
  register_location get_local_id(std::int32_t dimension) const;

  /// Where the size of the work-group lies, for `dimension` 0 to 2, from finalize() on. Throws
  /// unknown_argument_exception where it was not asked for.
  register_location get_local_size(std::int32_t dimension) const;

  /// Writes a kernel in OpenCL C with these arguments and requirements. It is compiled and never
  /// run. Throws interface_not_finalized, and unsupported_argument_location_override when an
  /// argument was placed by hand: a compiler places them as finalize() does.
  void emit_dummy_source(std::ostream& stream) const;

  /// Writes the metadata, YAML text of version 1.8. Throws as emit_dummy_source does, the latter
  /// also when an argument lies below the registers that the caller fills, or nowhere.
  void emit_metadata(std::ostream& stream) const;

  // What placing and the texts share.
  std::int32_t register_size() const { return hw < hw_pine ? 32 : 64; }  // bytes
  std::int32_t registers_per_local_id() const { return hw < hw_pine && simd > 16 ? 2 : 1; }
  std::int32_t first_free_register() const;  // behind the thread's header and its local IDs
  bool has_work_group_size() const;
  void require_finalized() const;  // throws as the texts do
};

/// The hidden argument that stands for the work-group's three sizes, one behind the other.
bool is_local_size_block(const kernel_argument& argument);
constexpr std::int32_t local_size_block_bytes = 12;

/// For global pointers.
inline bool has_access(const kernel_argument& argument, std::int32_t bit) {
  return argument.kind == argument_kind::global_pointer && (argument.access & bit) != 0;
}

}  // namespace kestrel::tarn::forge
