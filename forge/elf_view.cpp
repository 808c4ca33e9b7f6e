// SPDX-License-Identifier: Apache-2.0
// Checked reads of ELF files.
#include "elf_view.hpp"

#include <cstring>

namespace kestrel::tarn::forge {

std::optional<elf_view> elf_view::open(byte_view bytes) {
  Elf64_Ehdr header;
  if (!bytes.read(0, header) || std::memcmp(header.e_ident, ELFMAG, SELFMAG) != 0) {
    return std::nullopt;
  }
  return elf_view(bytes, header);
}

Elf64_Shdr elf_view::section(unsigned index) const {
  Elf64_Shdr section{};
  bytes_.read(section_at(index), section);
  return section;
}

std::optional<unsigned> elf_view::find_section(std::uint32_t type) const {
  for (unsigned i = 0; i < header_.e_shnum; ++i) {
    if (section(i).sh_type == type) {
      return i;
    }
  }
  return std::nullopt;
}

std::optional<byte_view> elf_view::contents(const Elf64_Shdr& section) const {
  if (!bytes_.holds(section.sh_offset, section.sh_size)) {
    return std::nullopt;
  }
  return byte_view(bytes_.data + section.sh_offset, section.sh_size);
}

}  // namespace kestrel::tarn::forge
