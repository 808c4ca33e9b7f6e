// SPDX-License-Identifier: Apache-2.0
// What the newer device binary says about its device: notes, and without them the file header.
#include <cstddef>
#include <cstdint>
#include <string>

#include <gtest/gtest.h>

#include "binaries.hpp"
#include "exceptions.hpp"
#include "parse_support.hpp"

namespace {

using namespace tarn_test;
namespace crate = kestrel::tarn::forge::crate;
using kestrel::tarn::forge::parse_binary;

constexpr std::uint32_t product = 1;
constexpr std::uint32_t core = 2;
constexpr std::uint32_t metadata = 3;

TEST(ParseNewer, CoreFamilyNoteWithSteppingNote) {
  expect_hw(newer_binary({{core, 3080}, {metadata, 0xFFFFE5FF}}), 7, 10, 5);
  expect_hw(newer_binary({{metadata, 31U << 8}, {core, 12}}), 1, 1, 31);
}

TEST(ParseNewer, UnknownCoreFamily) {
  expect_hw(newer_binary({{core, 3078}}), 0, 0, 0);
  expect_hw(newer_binary({{core, 3078}, {metadata, 0x100}}), 0, 0, 1);
}

TEST(ParseNewer, ProductNoteAlone) {
  expect_hw(newer_binary({{product, 1272}}), 6, 8, 0);
  expect_hw(newer_binary({{product, 1271}}), 7, 11, 0);
}

TEST(ParseNewer, FirstKnownCoreFamilyCounts) {
  expect_hw(newer_binary({{core, 3078}, {core, 3081}, {core, 12}}), 8, 14, 0);
}

TEST(ParseNewer, UnknownProductsAreSkipped) {
  expect_hw(newer_binary({{product, 1273}, {product, 1300}}), 6, 9, 0);
  expect_hw(newer_binary({{product, 0}, {product, 1274}}), 8, 14, 0);
}

TEST(ParseNewer, BothNotesAreTakenAsTheyAre) {
  expect_hw(newer_binary({{core, 3079}, {product, 1270}, {metadata, 0}}), 6, 7, 0);
}

TEST(ParseNewer, OtherNotesDoNotCount) {
  expect_hw(newer_binary({{4, 3079}, {0, 1270}}), 0, 0, 0);
}

TEST(ParseNewer, NoteNamesArePadded) {
  for (const char* name : {"", "a", "abc", "abcd", "a name of 17 char"}) {
    expect_hw(newer_binary({{metadata, 0x200, name}, {core, 18, name}}), 4, 4, 2);
  }
}

TEST(ParseNewer, DescriptorsOfOtherSizesAreSkipped) {
  for (const std::size_t size : {0, 1, 2, 3, 5, 8, 11, 12}) {
    byte_vector notes(12 + (size + 3) / 4 * 4);
    put32(notes, 4, size);
    put32(notes, 8, core);
    if (size != 0) {
      notes[12] = 12;  // would be Fir
    }
    append(notes, note_data({{core, 3079}}));
    expect_hw(
        elf_file({{".ze_info", type_metadata, {1}}, {".note.brinegt.compat", type_note, notes}}), 6,
        6, 0);
  }
}

TEST(ParseNewer, EmptyNoteSectionGivesNothing) {
  byte_vector file = newer_binary({});
  put16(file, at_e_machine, 3080);
  put32(file, at_e_flags, 1U << 15 | 5U << 8);
  expect_hw(file, 0, 0, 0);
}

TEST(ParseNewer, NotesThatReachBeyondTheirSectionEndTheWalk) {
  const byte_vector whole = newer_binary({{core, 3080}, {product, 1271}});
  const std::size_t second = data_at(whole, index_of_notes) + 24;
  for (const std::size_t field : {0, 4}) {  // name size, descriptor size
    for (const std::uint64_t size : {17ULL, 0x7FFFFFFFULL, 0xFFFFFFFDULL, 0xFFFFFFFFULL}) {
      byte_vector file = whole;
      put32(file, second + field, size);
      expect_hw(file, 7, 10, 0);
    }
  }
  byte_vector file = whole;
  put64(file, section_at(file, index_of_notes) + at_sh_size, 24 + 11);  // half a note
  expect_hw(file, 7, 10, 0);
}

TEST(ParseNewer, WithoutNotesFlagsSayWhatTheMachineIs) {
  expect_hw(newer_binary(3079, 1U << 15 | 0x0700), 6, 6, 7);
  expect_hw(newer_binary(1271, 0x1F00), 7, 11, 31);
  expect_hw(newer_binary(3079, 0), 0, 0, 0);  // not a product
  expect_hw(newer_binary(1271, 1U << 15), 0, 0, 0);
  expect_hw(newer_binary(18, 0), 1, 1, 0);  // 18 in both tables
  expect_hw(newer_binary(18, 1U << 15), 4, 4, 0);
}

TEST(ParseNewer, OnlyTheNoteSectionOfThatNameCounts) {
  const byte_vector notes = note_data({{core, 3080}});
  for (const char* name : {".note.brinegt.compatible", ".note.brinegt.compa", "", ".note"}) {
    byte_vector file = elf_file({{".ze_info", type_metadata, {1}}, {name, type_note, notes}});
    put16(file, at_e_machine, 26);
    expect_hw(file, 2, 2, 0);
  }
  byte_vector other_type =
      elf_file({{".ze_info", type_metadata, {1}}, {".note.brinegt.compat", 8, notes}});
  put16(other_type, at_e_machine, 26);
  expect_hw(other_type, 2, 2, 0);
}

TEST(ParseNewer, TheFirstOfTwoNoteSectionsCounts) {
  expect_hw(elf_file({{".note.brinegt.compat", type_note, note_data({{core, 16}})},
                      {".ze_info", type_metadata, {1}},
                      {".note.brinegt.compat", type_note, note_data({{core, 3080}})}}),
            3, 3, 0);
}

TEST(ParseNewer, NamesComeFromTheLastStringTable) {
  byte_vector file = newer_binary({{core, 3080}});
  put16(file, at_e_machine, 26);
  expect_hw(elf_file({{".note.brinegt.compat", type_note, note_data({{core, 16}})},
                      {"decoy", type_strings, counting(80, 1)},
                      {".ze_info", type_metadata, {1}}}),
            3, 3, 0);
  put32(file, section_at(file, 3) + at_sh_type, 1);  // no string table at all
  expect_hw(file, 2, 2, 0);
}

TEST(ParseNewer, NameOffsetsOutsideTheStringTable) {
  byte_vector file = newer_binary({{core, 3080}});
  put16(file, at_e_machine, 26);
  const std::size_t header = section_at(file, index_of_notes);
  for (const std::uint64_t name : {30ULL, 0x1000ULL, 0xFFFFFFFFULL}) {
    put32(file, header, name);
    expect_hw(file, 2, 2, 0);
  }
}

TEST(ParseNewer, ANameThatTheStringTableCutsIsNone) {
  byte_vector file = newer_binary({{core, 3080}});
  put16(file, at_e_machine, 26);
  const std::size_t name = get32(file, section_at(file, index_of_notes));
  put64(file, section_at(file, 3) + at_sh_size, name + 20);  // all but its NUL
  expect_hw(file, 2, 2, 0);
  put64(file, section_at(file, 3) + at_sh_size, name + 21);
  expect_hw(file, 7, 10, 0);
}

TEST(ParseNewer, HeaderFieldsOfTheFormat) {
  const byte_vector whole = newer_binary({{core, 3080}});
  byte_vector file = whole;
  put16(file, at_e_type, 0xFF12);
  expect_hw(file, 7, 10, 0);
  file = whole;
  file[6] = 0;  // version of the identification
  expect_hw(file, 7, 10, 0);

  // With any other value the file is taken for one of the older format, and has no program.
  for (const auto& [at, value] :
       {std::pair{4, 1}, std::pair{5, 2}, std::pair{6, 2}, std::pair{int{at_e_type}, 2},
        std::pair{int{at_e_shentsize}, 40}}) {
    file = whole;
    file[static_cast<std::size_t>(at)] = static_cast<std::uint8_t>(value);
    EXPECT_THROW(parse_binary(file), crate::no_binary_section) << at;
  }
  file = whole;
  put16(file, at_e_shnum, 0);
  EXPECT_THROW(parse_binary(file), crate::no_binary_section);
  file = whole;
  put32(file, section_at(file, 1) + at_sh_type, 1);  // no metadata section
  EXPECT_THROW(parse_binary(file), crate::no_binary_section);
}

TEST(ParseNewer, SectionsOutsideTheFile) {
  const byte_vector whole = newer_binary({{core, 3080}});
  for (const std::size_t index : {index_of_notes, std::size_t{3}}) {
    for (const std::size_t field : {at_sh_offset, at_sh_size}) {
      for (const std::uint64_t value :
           {std::uint64_t{whole.size() + 1}, ~std::uint64_t{0}, ~std::uint64_t{0} - 20}) {
        byte_vector file = whole;
        put64(file, section_at(file, index) + field, value);
        EXPECT_THROW(parse_binary(file), crate::bad_elf) << index << " " << field;
      }
    }
  }
}

TEST(ParseNewer, SectionHeadersOutsideTheFile) {
  const byte_vector whole = newer_binary({{core, 3080}});
  for (const std::uint64_t table : {std::uint64_t{whole.size()}, std::uint64_t{whole.size() - 255},
                                    ~std::uint64_t{0}, ~std::uint64_t{0} - 4 * 64 + 1}) {
    byte_vector file = whole;
    put64(file, at_e_shoff, table);
    EXPECT_THROW(parse_binary(file), crate::bad_elf) << table;
  }
  byte_vector file = whole;
  put16(file, at_e_shnum, 0xFFFF);
  EXPECT_THROW(parse_binary(file), crate::bad_elf);
}

TEST(ParseNewer, SectionHeadersAtOddPlaces) {
  byte_vector file = elf_file({{".ze_info", type_metadata, {1}},
                               {".note.brinegt.compat", type_note, note_data({{core, 3081}})}},
                              header_table::last);
  const std::size_t table = get64(file, at_e_shoff);
  file.insert(file.begin() + static_cast<std::ptrdiff_t>(table), 0xEE);
  put64(file, at_e_shoff, table + 1);
  expect_hw(file, 8, 14, 0);
}

TEST(ParseNewer, NoElf) {
  EXPECT_THROW(parse_binary(byte_vector{}), crate::bad_elf);
  EXPECT_THROW(parse_binary(byte_vector{0x7F, 'E', 'L', 'F'}), crate::bad_elf);
  for (std::size_t i = 0; i < 4; ++i) {
    byte_vector file = newer_binary({{core, 3080}});
    ++file[i];
    EXPECT_THROW(parse_binary(file), crate::bad_elf) << i;
  }
}

TEST(ParseNewer, ShortForms) {
  expect_short_forms_harmless(newer_binary({{core, 3080}, {product, 1271}}));
}

}  // namespace
