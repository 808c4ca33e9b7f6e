// SPDX-License-Identifier: Apache-2.0
// The writer: file header, five section headers, note, section names, metadata, code.
#include "elf_writer.hpp"

#include <cstring>
#include <elf.h>

#include "elf_view.hpp"

namespace kestrel::tarn::forge {
namespace {

constexpr Elf64_Half machine = 0xCD;
constexpr std::uint64_t section_alignment = 16;

// The names, each at the place that its section header states; the kernel's name follows at once.
constexpr char section_names[] = "\0.shstrtab\0.ze_info\0.note.brinegt.compat\0.text.";
constexpr std::uint64_t section_names_size = sizeof section_names - 1;
constexpr Elf64_Word name_of_names = 1;
constexpr Elf64_Word name_of_metadata = 11;
constexpr Elf64_Word name_of_note = 20;
constexpr Elf64_Word name_of_code = 41;

struct target_note {
  Elf64_Nhdr header = {sizeof name, sizeof core_family, 2};  // type 2: a core family number
  char name[8] = "BrineGT";
  std::uint32_t core_family;
};
static_assert(sizeof(target_note) == 24);

constexpr unsigned section_count = 5;
constexpr std::uint64_t table_at = sizeof(Elf64_Ehdr);
constexpr std::uint64_t note_at = table_at + section_count * sizeof(Elf64_Shdr);
constexpr std::uint64_t names_at = note_at + sizeof(target_note);

std::uint64_t rounded_up(std::uint64_t size) {
  return (size + section_alignment - 1) & ~(section_alignment - 1);
}

Elf64_Ehdr file_header() {
  Elf64_Ehdr header{};
  std::memcpy(header.e_ident, ELFMAG, SELFMAG);
  header.e_ident[EI_CLASS] = ELFCLASS64;
  header.e_ident[EI_DATA] = ELFDATA2LSB;
  header.e_ident[EI_VERSION] = EV_CURRENT;
  header.e_type = ET_REL;
  header.e_machine = machine;
  header.e_version = EV_CURRENT;
  header.e_shoff = table_at;
  header.e_ehsize = sizeof(Elf64_Ehdr);
  header.e_shentsize = sizeof(Elf64_Shdr);
  header.e_shnum = section_count;
  header.e_shstrndx = 1;
  return header;
}

Elf64_Shdr section(Elf64_Word name, Elf64_Word type, Elf64_Xword flags, Elf64_Off offset,
                   Elf64_Xword size) {
  return {name, type, flags, 0, offset, size, 0, 0, section_alignment, 0};
}

}  // namespace

byte_vector write_binary(std::uint32_t core_family, const std::string& kernel_name,
                         const std::string& metadata, byte_view code) {
  const std::uint64_t names_size = section_names_size + kernel_name.size() + 1;
  // One whole alignment behind the last name, where it ends on the alignment already.
  const std::uint64_t metadata_at =
      (names_at + names_size + section_alignment) & ~(section_alignment - 1);
  const std::uint64_t code_at = metadata_at + rounded_up(metadata.size());
  const Elf64_Shdr sections[section_count] = {
      section(0, SHT_NULL, 0, 0, 0),
      section(name_of_names, SHT_STRTAB, 0, names_at, names_size),
      section(name_of_metadata, section_type_metadata, 0, metadata_at, metadata.size()),
      section(name_of_code, SHT_PROGBITS, SHF_ALLOC | SHF_EXECINSTR, code_at, code.size),
      section(name_of_note, SHT_NOTE, 0, note_at, sizeof(target_note)),
  };
  target_note note{};
  note.core_family = core_family;

  byte_vector binary(rounded_up(code_at + code.size));
  put(binary.data(), 0, file_header());
  put(binary.data(), table_at, sections);
  put(binary.data(), note_at, note);
  std::memcpy(binary.data() + names_at, section_names, section_names_size);
  std::memcpy(binary.data() + names_at + section_names_size, kernel_name.data(),
              kernel_name.size());
  std::memcpy(binary.data() + metadata_at, metadata.data(), metadata.size());
  if (code.size != 0) {  // memcpy takes no null pointer
    std::memcpy(binary.data() + code_at, code.data, code.size);
  }
  return binary;
}

}  // namespace kestrel::tarn::forge
