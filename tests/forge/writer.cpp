// SPDX-License-Identifier: Apache-2.0
// The newer binary as it is written: every field from the layout, for lengths on both sides of each
// rounding, and what the reader makes of it.
#include <cstddef>
#include <cstdint>
#include <string>

#include <gtest/gtest.h>

#include "binaries.hpp"
#include "elf_writer.hpp"
#include "hw_codes.hpp"
#include "parse_support.hpp"

namespace {

using namespace tarn_test;
using kestrel::tarn::forge::byte_view;
using kestrel::tarn::forge::core_family_of_hw;
using kestrel::tarn::forge::hw_code;
using kestrel::tarn::forge::write_binary;

struct header_row {
  std::uint64_t name, type, flags, offset, size;
};

void put_text(byte_vector& bytes, std::size_t at, const std::string& text) {
  for (const char each : text) {
    bytes.at(at++) = static_cast<std::uint8_t>(each);
  }
}

/// The file of a kernel, field by field; all that is not named is 0.
byte_vector layout(std::uint32_t core_family, const std::string& name, const std::string& metadata,
                   const byte_vector& code) {
  const std::size_t s = name.size();
  const std::size_t z = metadata.size();
  const std::size_t metadata_at = (s + 472) / 16 * 16;
  const std::size_t code_at = metadata_at + (z + 15) / 16 * 16;
  byte_vector file((code_at + code.size() + 15) / 16 * 16);
  const byte_vector identification = {0x7F, 0x45, 0x4C, 0x46, 2, 1, 1, 0};
  std::copy(identification.begin(), identification.end(), file.begin());
  put16(file, 16, 1);     // relocatable
  put16(file, 18, 0xCD);  // machine
  put32(file, 20, 1);     // version
  put64(file, 40, 64);    // section headers
  put16(file, 52, 64);    // size of the file header
  put16(file, 58, 64);    // size of a section header
  put16(file, 60, 5);     // section headers
  put16(file, 62, 1);     // section of the names
  const header_row rows[5] = {{0, 0, 0, 0, 0},
                              {1, 3, 0, 408, s + 48},
                              {11, 0xFF000011, 0, metadata_at, z},
                              {41, 1, 6, code_at, code.size()},
                              {20, 7, 0, 384, 24}};
  for (std::size_t i = 0; i < 5; ++i) {
    put32(file, 64 + 64 * i, rows[i].name);
    put32(file, 64 + 64 * i + 4, rows[i].type);
    put64(file, 64 + 64 * i + 8, rows[i].flags);
    put64(file, 64 + 64 * i + 24, rows[i].offset);
    put64(file, 64 + 64 * i + 32, rows[i].size);
    put64(file, 64 + 64 * i + 48, 16);  // alignment
  }
  put32(file, 384, 8);
  put32(file, 388, 4);
  put32(file, 392, 2);
  put_text(file, 396, "BrineGT");
  put32(file, 404, core_family);
  put_text(file, 409, ".shstrtab");
  put_text(file, 419, ".ze_info");
  put_text(file, 428, ".note.brinegt.compat");
  put_text(file, 449, ".text." + name);
  put_text(file, metadata_at, metadata);
  std::copy(code.begin(), code.end(), file.begin() + static_cast<std::ptrdiff_t>(code_at));
  return file;
}

TEST(WriteBinary, EveryLength) {
  for (std::size_t name = 0; name <= 33; ++name) {
    for (const std::size_t metadata : {0, 1, 15, 16, 17, 300}) {
      for (const std::size_t code : {0, 1, 16, 33, 1024}) {
        const std::string name_text(name, 'k');
        const std::string metadata_text(metadata, 'm');
        const byte_vector code_bytes = counting(code, 1);
        ASSERT_EQ(write_binary(3080, name_text, metadata_text, code_bytes),
                  layout(3080, name_text, metadata_text, code_bytes))
            << name << " " << metadata << " " << code;
      }
    }
  }
}

TEST(WriteBinary, SomePlacesByHand) {
  // The names of "binary_test", 11 letters, end at 467; of 8 letters at 464, which is on the
  // alignment already, and gets one more.
  const byte_vector file = write_binary(12, "binary_test", "version: 1.8\n", counting(32, 1));
  EXPECT_EQ(file.size(), 528U);
  EXPECT_EQ(data_at(file, 2), 480U);
  EXPECT_EQ(data_at(file, 3), 496U);
  EXPECT_EQ(data_at(write_binary(12, "8letters", "", byte_view()), 2), 480U);
  EXPECT_EQ(data_at(write_binary(12, "letters", "", byte_view()), 2), 464U);
}

TEST(WriteBinary, TheReaderFindsTheGeneration) {
  const int families[] = {0, 1, 0, 3, 4, 0, 6, 10, 14};
  for (const int hw : {1, 3, 4, 6, 7, 8}) {
    const std::uint32_t core_family = core_family_of_hw(static_cast<hw_code>(hw));
    expect_hw(write_binary(core_family, "binary_test", "text", counting(64, 0)), hw, families[hw],
              0);
  }
}

}  // namespace
