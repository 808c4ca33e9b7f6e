// SPDX-License-Identifier: Apache-2.0
// Device binaries for the tests, written byte by byte from the description of their formats and
// without the library's own records. What is wrong with a file is put there by the test afterwards.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <string>
#include <vector>

namespace tarn_test {

using byte_vector = std::vector<std::uint8_t>;

// Section types of device binaries.
constexpr std::uint32_t type_program = 0xFF000005;
constexpr std::uint32_t type_driver_own = 0xFF000008;
constexpr std::uint32_t type_metadata = 0xFF000011;
constexpr std::uint32_t type_strings = 3;
constexpr std::uint32_t type_note = 7;

// Places of fields, in bytes from the start of the file, a section header, the program section.
constexpr std::size_t at_e_type = 16;
constexpr std::size_t at_e_machine = 18;
constexpr std::size_t at_e_shoff = 40;
constexpr std::size_t at_e_flags = 48;
constexpr std::size_t at_e_shentsize = 58;
constexpr std::size_t at_e_shnum = 60;
constexpr std::size_t at_sh_type = 4;
constexpr std::size_t at_sh_offset = 24;
constexpr std::size_t at_sh_size = 32;
constexpr std::size_t at_kernel_checksum = 28;
constexpr std::size_t at_kernel_name = 68;

void put16(byte_vector& bytes, std::size_t at, std::uint32_t value);
void put32(byte_vector& bytes, std::size_t at, std::uint64_t value);
void put64(byte_vector& bytes, std::size_t at, std::uint64_t value);
std::uint64_t get16(const byte_vector& bytes, std::size_t at);
std::uint64_t get32(const byte_vector& bytes, std::size_t at);
std::uint64_t get64(const byte_vector& bytes, std::size_t at);
void append(byte_vector& bytes, const byte_vector& more);
/// The bytes [begin, end).
byte_vector cut(const byte_vector& bytes, std::size_t begin, std::size_t end);
/// `count` bytes that count up from `first`.
byte_vector counting(std::size_t count, std::uint8_t first);

struct elf_section {
  std::string name;
  std::uint32_t type;
  byte_vector data;
};

enum class header_table { first, last };

/// An ELF64 file: section 0, which is empty, the given sections from 1 on, and the string table of
/// their names. The section headers stand at 64, or behind everything; data are aligned to 16.
byte_vector elf_file(const std::vector<elf_section>& sections,
                     header_table table = header_table::first);
/// Where a section header lies.
std::size_t section_at(const byte_vector& file, std::size_t index);
/// Where the data of a section lie.
std::size_t data_at(const byte_vector& file, std::size_t index);

struct note {
  std::uint32_t type;
  std::uint32_t value;
  std::string name = "BrineGT";  // NUL not counted
};
byte_vector note_data(const std::vector<note>& notes);
/// Of the newer format, without a note section.
byte_vector newer_binary(std::uint32_t machine, std::uint32_t flags);
/// Of the newer format, with its note section as number `index_of_notes`.
constexpr std::size_t index_of_notes = 2;
byte_vector newer_binary(const std::vector<note>& notes);

byte_vector patch_token(std::uint32_t type, const byte_vector& contents);

struct older_kernel {
  std::uint32_t core_family = 18;
  std::uint32_t stepping = 6;
  std::string name = "binary_test";
  byte_vector kernel_heap = counting(300, 1);
  byte_vector general_state = counting(12, 101);
  byte_vector dynamic_state = counting(20, 121);
  byte_vector surface_state = counting(36, 151);
  byte_vector patch_list;
  byte_vector more;  // what follows the kernel in the program section
};
/// The program section of a kernel, with its checksum.
byte_vector program_data(const older_kernel& kernel);
/// The first 28 bytes of it alone.
byte_vector program_header(const older_kernel& kernel);
/// A file of the older format: before the program section, which is number `index_of_program`,
/// stands one of type_driver_own, behind it another one, and one of build options.
constexpr std::size_t index_of_program = 2;
byte_vector older_binary(const older_kernel& kernel, header_table table = header_table::first);

/// The checksum by a second way: signed 64-bit numbers reduced modulo 2^32.
std::uint32_t model_hash(const byte_vector& bytes);
/// Makes the checksum of a file of the older format right again.
void repair_checksum(byte_vector& file);

}  // namespace tarn_test
