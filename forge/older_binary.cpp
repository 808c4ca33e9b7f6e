// SPDX-License-Identifier: Apache-2.0
// Checks of the older device binary. All offsets are sums of one that lies inside the file and of
// at most seven sizes of 32 bits, so 64 bits hold them.
#include "older_binary.hpp"

#include <optional>
#include <stdexcept>

#include "binary_hash.hpp"
#include "exceptions.hpp"

namespace kestrel::tarn::forge {
namespace {

constexpr std::uint32_t program_magic = 0x454E5242;  // "BRNE"

/// Whether the section headers overlap the file header or the bytes [begin, end).
bool headers_overlap(const elf_view& elf, std::uint64_t begin, std::uint64_t end) {
  const std::uint64_t table = elf.header().e_shoff;
  const std::uint64_t table_end = table + elf.sections_size();
  return table < sizeof(Elf64_Ehdr) || (table < end && begin < table_end);
}

}  // namespace

void throw_fault(binary_fault fault) {
  switch (fault) {
    case binary_fault::none:
      return;
    case binary_fault::no_elf:
      throw crate::bad_elf();
    case binary_fault::no_program:
      throw crate::no_binary_section();
    case binary_fault::bad_program:
      throw crate::bad_binary_section();
    case binary_fault::bad_checksum:
      throw crate::invalid_checksum();
    case binary_fault::too_large:
      throw std::length_error("The code or its patches do not fit a device binary");
  }
}

binary_fault find_program(const elf_view& elf, program_section& program) {
  if (!elf.has_sections()) {
    return binary_fault::no_elf;
  }
  const std::optional<unsigned> index = elf.find_section(section_type_program);
  if (!index) {
    return binary_fault::no_program;
  }
  const Elf64_Shdr section = elf.section(*index);
  if (section.sh_size < sizeof(program_header)) {
    return binary_fault::no_program;
  }
  program.index = *index;
  program.offset = section.sh_offset;
  program.size = section.sh_size;
  if (!elf.bytes().read(program.offset, program.header) || program.header.magic != program_magic ||
      program.header.kernel_count != 1 || program.header.patch_list_size != 0) {
    return binary_fault::bad_program;
  }
  return binary_fault::none;
}

binary_fault find_kernel(const elf_view& elf, const program_section& program,
                         kernel_parts& kernel) {
  const byte_view bytes = elf.bytes();
  const kernel_header& header = kernel.header;
  kernel.header_at = program.offset + sizeof(program_header);
  if (!bytes.read(kernel.header_at, kernel.header)) {
    return binary_fault::bad_program;
  }
  kernel.name = kernel.header_at + sizeof(kernel_header);
  kernel.heap = kernel.name + header.name_size;
  kernel.states = kernel.heap + header.kernel_heap_size;
  kernel.patches = kernel.states + header.general_state_size +
                   std::uint64_t{header.dynamic_state_size} + header.surface_state_size;
  kernel.end = kernel.patches + header.patch_list_size;
  // Only the file bounds the kernel: what sh_size says beyond the program header is not needed.
  if (!bytes.holds(program.offset, kernel.end - program.offset) ||
      program.offset < sizeof(Elf64_Ehdr) || headers_overlap(elf, program.offset, kernel.end)) {
    return binary_fault::bad_program;
  }
  return binary_hash(bytes.data + kernel.name, kernel.end - kernel.name) == header.checksum
             ? binary_fault::none
             : binary_fault::bad_checksum;
}

}  // namespace kestrel::tarn::forge
