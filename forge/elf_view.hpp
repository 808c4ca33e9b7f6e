// SPDX-License-Identifier: Apache-2.0
// A careful look at a little-endian ELF64 file (System V gABI, chapter 4). The files come out of
// drivers, or from anywhere: nothing in them is believed before it is compared with their length.
#pragma once

#include <cstdint>
#include <elf.h>
#include <optional>

#include "bytes.hpp"

namespace kestrel::tarn::forge {

/// What device binaries add to the section types of <elf.h>.
inline constexpr std::uint32_t section_type_program = 0xFF000005;     // of the older binary
inline constexpr std::uint32_t section_type_driver_own = 0xFF000008;  // loses its type in a splice
inline constexpr std::uint32_t section_type_metadata = 0xFF000011;    // of the newer binary

class elf_view {
 public:
  /// Nothing, unless the bytes begin with the magic number and hold a whole file header.
  static std::optional<elf_view> open(byte_view bytes);

  byte_view bytes() const { return bytes_; }
  const Elf64_Ehdr& header() const { return header_; }

  /// Whether the table of section headers lies inside the file. Its entries have the size that
  /// ELF64 gives them, whatever e_shentsize says.
  bool has_sections() const { return bytes_.holds(header_.e_shoff, sections_size()); }
  /// In bytes; at most 65535 entries.
  std::uint64_t sections_size() const {
    return std::uint64_t{header_.e_shnum} * sizeof(Elf64_Shdr);
  }
  /// Where a section header lies, from 0 to e_shnum - 1; only where has_sections().
  std::uint64_t section_at(unsigned index) const {
    return header_.e_shoff + std::uint64_t{index} * sizeof(Elf64_Shdr);
  }
  Elf64_Shdr section(unsigned index) const;
  /// The number of the first section of a type; only where has_sections().
  std::optional<unsigned> find_section(std::uint32_t type) const;
  /// What a section holds; nothing if any of it lies outside the file.
  std::optional<byte_view> contents(const Elf64_Shdr& section) const;

 private:
  elf_view(byte_view bytes, const Elf64_Ehdr& header) : bytes_(bytes), header_(header) {}

  byte_view bytes_;
  Elf64_Ehdr header_;
};

}  // namespace kestrel::tarn::forge
