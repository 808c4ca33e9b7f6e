// SPDX-License-Identifier: Apache-2.0
// What the older device binary says about its device: the header of its program section, and for
// two numbers the instructions.
#include <cstddef>
#include <cstdint>
#include <utility>

#include <gtest/gtest.h>

#include "binaries.hpp"
#include "exceptions.hpp"
#include "parse_support.hpp"

namespace {

using namespace tarn_test;
namespace crate = kestrel::tarn::forge::crate;
using kestrel::tarn::forge::parse_binary;

const byte_vector yew_instruction = {0x31, 0, 0,    0x80, 0x04, 0, 0, 0,
                                     0x0C, 0, 0x20, 0x30, 0,    0, 0, 0};

older_kernel of_core_family(std::uint32_t number) {
  older_kernel kernel;
  kernel.core_family = number;
  return kernel;
}

TEST(ParseOlder, CoreFamilies) {
  struct row {
    std::uint32_t number;
    int hw, family;
  };
  for (const row& each : {row{12, 1, 1}, row{13, 2, 2}, row{14, 2, 2}, row{15, 3, 3}, row{16, 3, 3},
                          row{17, 5, 5}, row{18, 4, 4}, row{3077, 5, 5}, row{3079, 6, 6},
                          row{3080, 7, 10}, row{3081, 8, 14}, row{3078, 0, 0}}) {
    expect_hw(older_binary(of_core_family(each.number)), each.hw, each.family, 6);
  }
}

TEST(ParseOlder, SteppingIsTheWholeField) {
  older_kernel kernel;
  kernel.stepping = 0xFEDCBA98;
  expect_hw(older_binary(kernel, header_table::last), 4, 4, 0xFEDCBA98);
}

TEST(ParseOlder, TheInstructionOfYewInBinariesOfOak) {
  for (const std::uint32_t number : {17U, 3077U}) {
    for (std::size_t place = 0; place < 4; ++place) {  // no alignment is needed
      older_kernel kernel = of_core_family(number);
      kernel.kernel_heap = counting(40 + place, 1);
      append(kernel.kernel_heap, yew_instruction);
      expect_hw(older_binary(kernel), 6, 5, 6);
    }
  }
  older_kernel other = of_core_family(18);
  other.kernel_heap = yew_instruction;
  expect_hw(older_binary(other), 4, 4, 6);
}

TEST(ParseOlder, OnlyTheseBitsOfTheInstructionVary) {
  for (std::size_t byte = 0; byte < yew_instruction.size(); ++byte) {
    for (int bit = 0; bit < 8; ++bit) {
      older_kernel kernel = of_core_family(17);
      kernel.kernel_heap = yew_instruction;
      kernel.kernel_heap[byte] ^= static_cast<std::uint8_t>(1 << bit);
      const bool varies = byte == 1 || byte == 9 || (byte == 2 && bit < 2);
      expect_hw(older_binary(kernel), varies ? 6 : 5, 5, 6);
    }
  }
}

TEST(ParseOlder, TheLookEnds16BytesBeforeTheEnd) {
  byte_vector file = older_binary(of_core_family(17));
  append(file, yew_instruction);
  expect_hw(file, 5, 5, 6);
  file.push_back(0);
  expect_hw(file, 6, 5, 6);
}

TEST(ParseOlder, ASectionOf28BytesIsJudgedByItsFields) {
  const byte_vector header = program_header(of_core_family(3080));
  ASSERT_EQ(header.size(), 28U);
  expect_hw(elf_file({{"program", type_program, header}}, header_table::last), 7, 10, 6);
}

TEST(ParseOlder, NoProgramSection) {
  EXPECT_THROW(parse_binary(elf_file({{"other", 1, counting(100, 0)}})), crate::no_binary_section);
  byte_vector file = older_binary({});
  put64(file, section_at(file, index_of_program) + at_sh_size, 27);
  EXPECT_THROW(parse_binary(file), crate::no_binary_section);
}

TEST(ParseOlder, TheFirstProgramSectionCounts) {
  byte_vector decoy = program_header(of_core_family(3081));
  expect_hw(elf_file({{"program", type_program, program_header(of_core_family(15))},
                      {"program", type_program, decoy}}),
            3, 3, 6);
  decoy[0] = 'b';
  EXPECT_THROW(parse_binary(elf_file(
                   {{"bad", type_program, decoy}, {"good", type_program, program_header({})}})),
               crate::bad_binary_section);
}

TEST(ParseOlder, FieldsOfTheProgramHeader) {
  const byte_vector whole = older_binary({});
  const std::size_t program = data_at(whole, index_of_program);
  const std::pair<std::size_t, std::uint64_t> wrong[] = {
      {0, 0x45524E42}, {0, 0}, {16, 0}, {16, 2}, {16, 0xFFFFFFFF}, {24, 1}, {24, 0x80000000}};
  for (const auto& [field, value] : wrong) {
    byte_vector file = whole;
    put32(file, program + field, value);
    EXPECT_THROW(parse_binary(file), crate::bad_binary_section) << field << " " << value;
  }
  byte_vector file = whole;
  put32(file, program + 4, 77);   // version and
  put32(file, program + 12, 4);   // pointer size are not judged,
  put32(file, program + 28, 77);  // nor is the checksum
  expect_hw(file, 4, 4, 6);
}

TEST(ParseOlder, AProgramOutsideTheFile) {
  const byte_vector whole = older_binary({});
  for (const std::uint64_t offset : {std::uint64_t{whole.size() - 27}, std::uint64_t{whole.size()},
                                     ~std::uint64_t{0} - 26, ~std::uint64_t{0}}) {
    byte_vector file = whole;
    put64(file, section_at(file, index_of_program) + at_sh_offset, offset);
    EXPECT_THROW(parse_binary(file), crate::bad_binary_section) << offset;
  }
}

TEST(ParseOlder, SectionHeadersOutsideTheFile) {
  byte_vector file = older_binary({}, header_table::last);
  file.pop_back();
  EXPECT_THROW(parse_binary(file), crate::bad_elf);
}

TEST(ParseOlder, ShortForms) {
  expect_short_forms_harmless(older_binary(of_core_family(17)));
  expect_short_forms_harmless(older_binary(of_core_family(17), header_table::last));
}

}  // namespace
