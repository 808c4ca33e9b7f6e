// SPDX-License-Identifier: Apache-2.0
// The older device binary: an ELF with one program section that holds one kernel.
#pragma once

#include <cstdint>

#include "bytes.hpp"
#include "elf_view.hpp"

namespace kestrel::tarn::forge {

/// What can be wrong with a binary, and with a splice of it.
enum class binary_fault {
  none,
  no_elf,        // or its section headers lie outside the file
  no_program,    // no program section, or too short for the program header
  bad_program,   // not one kernel of the known layout inside the file
  bad_checksum,  // the kernel's data are not what the checksum was made of
  too_large,     // the new kernel's sizes do not fit the fields of 32 bits
};

/// Throws the exception of namespace crate that tells of a fault, std::length_error for too_large;
/// returns for none.
void throw_fault(binary_fault fault);

/// At the start of the program section. Sizes are in bytes, here and below.
struct program_header {
  std::uint32_t magic;
  std::uint32_t version;
  std::uint32_t core_family;
  std::uint32_t pointer_size;
  std::uint32_t kernel_count;
  std::uint32_t stepping;
  std::uint32_t patch_list_size;
};
static_assert(sizeof(program_header) == 28);

/// Behind the program header. The name, the four heaps and the patch list follow in this order.
struct kernel_header {
  std::uint32_t checksum;
  std::uint32_t shader_hash[2];
  std::uint32_t name_size;
  std::uint32_t patch_list_size;
  std::uint32_t kernel_heap_size;
  std::uint32_t general_state_size;
  std::uint32_t dynamic_state_size;
  std::uint32_t surface_state_size;
  std::uint32_t unpadded_kernel_size;
};
static_assert(sizeof(kernel_header) == 40);

struct program_section {
  unsigned index = 0;        // of its section header
  std::uint64_t offset = 0;  // in the file
  std::uint64_t size = 0;    // as the section header has it
  program_header header{};
};

/// Finds the program section and checks its header.
binary_fault find_program(const elf_view& elf, program_section& program);

/// Where the kernel's parts lie in the file: the name starts at `name`, the kernel heap takes
/// [heap, states), the other heaps [states, patches), the patch list [patches, end).
struct kernel_parts {
  kernel_header header{};
  std::uint64_t header_at = 0;
  std::uint64_t name = 0;
  std::uint64_t heap = 0;
  std::uint64_t states = 0;
  std::uint64_t patches = 0;
  std::uint64_t end = 0;
};

/// Finds the kernel of a program and checks that it lies inside its section, the section inside the
/// file, clear of the file header and the section headers, and that the checksum is right.
binary_fault find_kernel(const elf_view& elf, const program_section& program, kernel_parts& kernel);

}  // namespace kestrel::tarn::forge
