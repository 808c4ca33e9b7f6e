// SPDX-License-Identifier: Apache-2.0
// The newer binary names its target in a note section, and failing that in the file header; the
// older one in the header of its program section.
#include "parse_binary.hpp"

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <elf.h>
#include <optional>

#include "elf_view.hpp"
#include "exceptions.hpp"
#include "older_binary.hpp"

namespace kestrel::tarn::forge {
namespace {

constexpr Elf64_Half file_type_device = 0xFF12;  // beside ET_REL
constexpr char compat_note[] = ".note.brinegt.compat";

constexpr std::uint32_t note_product = 1;
constexpr std::uint32_t note_core_family = 2;
constexpr std::uint32_t note_target_metadata = 3;

/// Both the metadata note and the flags in the file header keep the stepping in bits 8 to 12.
std::uint32_t stepping_of(std::uint32_t word) {
  return (word >> 8) & 31;
}

bool is_newer(const elf_view& elf) {
  const Elf64_Ehdr& header = elf.header();
  return header.e_ident[EI_CLASS] == ELFCLASS64 && header.e_ident[EI_DATA] == ELFDATA2LSB &&
         header.e_ident[EI_VERSION] <= EV_CURRENT && header.e_shentsize == sizeof(Elf64_Shdr) &&
         (header.e_type == ET_REL || header.e_type == file_type_device) && elf.has_sections() &&
         elf.find_section(section_type_metadata);
}

/// What a section holds that the answer depends on.
byte_view needed_contents(const elf_view& elf, const Elf64_Shdr& section) {
  const std::optional<byte_view> contents = elf.contents(section);
  if (!contents) {
    throw crate::bad_elf();
  }
  return *contents;
}

/// The last string table; empty if there is none.
byte_view string_table(const elf_view& elf) {
  for (unsigned i = elf.header().e_shnum; i > 0; --i) {
    const Elf64_Shdr section = elf.section(i - 1);
    if (section.sh_type == SHT_STRTAB) {
      return needed_contents(elf, section);
    }
  }
  return {};
}

std::optional<byte_view> find_compat_note(const elf_view& elf) {
  const byte_view names = string_table(elf);
  for (unsigned i = 0; i < elf.header().e_shnum; ++i) {
    const Elf64_Shdr section = elf.section(i);
    if (section.sh_type == SHT_NOTE && names.holds(section.sh_name, sizeof compat_note) &&
        std::memcmp(names.data + section.sh_name, compat_note, sizeof compat_note) == 0) {
      return needed_contents(elf, section);
    }
  }
  return std::nullopt;
}

std::uint64_t padded(std::uint32_t size) {
  return (std::uint64_t{size} + 3) & ~std::uint64_t{3};
}

void take_note(std::uint32_t type, std::uint32_t value, detected_hw& found) {
  if (type == note_product) {
    const family_code family = family_of_product(value);
    found.family = family != 0 ? family : found.family;
  } else if (type == note_core_family && found.hw == hw_unknown) {
    found.hw = hw_of_core_family(value);
  } else if (type == note_target_metadata) {
    found.stepping = stepping_of(value);
  }
}

/// Walks the notes until the section ends, or one reaches beyond it. Only those with a descriptor
/// of 4 bytes count.
detected_hw read_notes(byte_view section) {
  detected_hw found;
  std::uint64_t at = 0;
  for (Elf64_Nhdr note; section.read(at, note);) {
    const std::uint64_t descriptor = at + sizeof note + padded(note.n_namesz);
    if (!section.holds(descriptor, note.n_descsz)) {
      break;
    }
    std::uint32_t value = 0;
    if (note.n_descsz == sizeof value && section.read(descriptor, value)) {
      take_note(note.n_type, value, found);
    }
    at = descriptor + padded(note.n_descsz);
  }
  return with_missing_code(found);
}

detected_hw read_file_header(const Elf64_Ehdr& header) {
  constexpr Elf64_Word machine_is_core_family = 1U << 15;
  detected_hw found;
  found.stepping = stepping_of(header.e_flags);
  if ((header.e_flags & machine_is_core_family) != 0) {
    found.hw = hw_of_core_family(header.e_machine);
  } else {
    found.family = family_of_product(header.e_machine);
  }
  return with_missing_code(found);
}

detected_hw parse_newer(const elf_view& elf) {
  const std::optional<byte_view> note = find_compat_note(elf);
  return note ? read_notes(*note) : read_file_header(elf.header());
}

/// Whether the instruction is there that, of all generations whose binaries say "Oak", only Yew's
/// compiler emits in a kernel that does nothing. Bytes 1 and 9 and the low bits of byte 2 vary. The
/// place 16 bytes before the end is not looked at any more.
bool has_yew_instruction(byte_view file) {
  constexpr std::uint8_t pattern[16] = {0x31, 0, 0,    0x80, 0x04, 0, 0, 0,
                                        0x0C, 0, 0x20, 0x30, 0,    0, 0, 0};
  for (std::size_t at = 0; at + sizeof pattern < file.size; ++at) {
    std::uint8_t candidate[sizeof pattern];
    std::memcpy(candidate, file.data + at, sizeof candidate);
    candidate[1] = 0;
    candidate[2] &= 0xFC;
    candidate[9] = 0;
    if (std::memcmp(candidate, pattern, sizeof pattern) == 0) {
      return true;
    }
  }
  return false;
}

detected_hw parse_older(const elf_view& elf) {
  program_section program;
  throw_fault(find_program(elf, program));
  detected_hw found;
  found.hw = hw_of_core_family(program.header.core_family);
  found.stepping = program.header.stepping;
  found = with_missing_code(found);
  if (found.hw == hw_oak && has_yew_instruction(elf.bytes())) {
    found.hw = hw_yew;  // the family stays that of the number
  }
  return found;
}

}  // namespace

detected_hw parse_binary(byte_view binary) {
  const std::optional<elf_view> elf = elf_view::open(binary);
  if (!elf) {
    throw crate::bad_elf();
  }
  return is_newer(*elf) ? parse_newer(*elf) : parse_older(*elf);
}

}  // namespace kestrel::tarn::forge
