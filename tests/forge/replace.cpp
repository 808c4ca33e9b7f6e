// SPDX-License-Identifier: Apache-2.0
// replace_kernel: the rewritten file byte by byte, as put together here from its parts, and every
// refusal.
#include <cstddef>
#include <cstdint>
#include <stdexcept>
#include <vector>

#include <gtest/gtest.h>

#include "binaries.hpp"
#include "exceptions.hpp"
#include "parse_support.hpp"
#include "replace_kernel.hpp"

namespace {

using namespace tarn_test;
namespace crate = kestrel::tarn::forge::crate;
using kestrel::tarn::forge::byte_view;
using kestrel::tarn::forge::parse_binary;
using kestrel::tarn::forge::replace_kernel;

// Fields of the program section.
constexpr std::size_t at_name_size = 40;
constexpr std::size_t at_patch_list_size = 44;
constexpr std::size_t at_heap_size = 48;
constexpr std::size_t at_unpadded_size = 64;

older_kernel full_kernel() {
  older_kernel kernel;
  kernel.patch_list = patch_token(52, counting(12, 201));
  append(kernel.patch_list, patch_token(7, counting(8, 221)));
  kernel.more = counting(21, 241);
  return kernel;
}

/// The kernel as it has to be in the result, its heap with its padding.
older_kernel with_code(older_kernel kernel, const byte_vector& code, const byte_vector& patches) {
  kernel.kernel_heap = code;
  kernel.kernel_heap.resize((code.size() + 64 + 255) / 256 * 256);
  append(kernel.patch_list, patches);
  return kernel;
}

/// The result that is wanted, by moving the parts of the file; `wanted` is the new kernel.
byte_vector expected_file(const byte_vector& file, const older_kernel& kernel,
                          const older_kernel& wanted, std::size_t code_size) {
  const std::size_t program = data_at(file, index_of_program);
  const byte_vector before = program_data(kernel);
  byte_vector after = program_data(wanted);
  put32(after, at_unpadded_size, code_size);
  byte_vector result = cut(file, 0, program);
  append(result, after);
  append(result, cut(file, program + before.size(), file.size()));
  const std::uint64_t growth = after.size() - before.size();  // modulo 2^64
  if (get64(file, at_e_shoff) > program) {
    put64(result, at_e_shoff, get64(file, at_e_shoff) + growth);
  }
  put64(result, section_at(result, index_of_program) + at_sh_size, after.size());
  for (std::size_t i = index_of_program + 1; i < get16(file, at_e_shnum); ++i) {
    put64(result, section_at(result, i) + at_sh_offset, data_at(file, i) + growth);
  }
  return result;
}

TEST(ReplaceKernel, TheWholeFile) {
  for (const header_table table : {header_table::first, header_table::last}) {
    for (const std::size_t code_size : {0, 1, 16, 191, 192, 193, 1000}) {
      for (const std::size_t patch_size : {0, 4, 40}) {
        const older_kernel kernel = full_kernel();
        const byte_vector file = older_binary(kernel, table);
        const byte_vector code = counting(code_size, 17);
        byte_vector patches;
        if (patch_size >= 8) {
          patches = patch_token(52, counting(patch_size - 8, 33));
        } else {
          patches = counting(patch_size, 33);
        }
        const byte_vector result = replace_kernel(file, code, patches);
        const byte_vector expected =
            expected_file(file, kernel, with_code(kernel, code, patches), code_size);
        ASSERT_EQ(result, expected) << code_size << " " << patch_size;
      }
    }
  }
}

TEST(ReplaceKernel, HeapSizes) {
  const byte_vector file = older_binary({});
  const std::pair<std::size_t, std::uint64_t> sizes[] = {{0, 256},   {1, 256},   {192, 256},
                                                         {193, 512}, {448, 512}, {449, 768}};
  for (const auto& [code_size, heap_size] : sizes) {
    const byte_vector result = replace_kernel(file, counting(code_size, 0), byte_vector{});
    const std::size_t program = data_at(result, index_of_program);
    EXPECT_EQ(get32(result, program + at_heap_size), heap_size) << code_size;
    EXPECT_EQ(get32(result, program + at_unpadded_size), code_size);
    EXPECT_EQ(result.size(), file.size() - 300 + heap_size);
  }
}

TEST(ReplaceKernel, TheResultCanBeReadAndReplacedAgain) {
  const older_kernel kernel = full_kernel();
  const byte_vector first =
      replace_kernel(older_binary(kernel), counting(777, 3), patch_token(9, counting(4, 0)));
  expect_hw(first, 4, 4, 6);
  const byte_vector second = replace_kernel(first, kernel.kernel_heap, byte_vector{});
  expect_hw(second, 4, 4, 6);
  older_kernel wanted = kernel;
  append(wanted.patch_list, patch_token(9, counting(4, 0)));
  wanted = with_code(wanted, kernel.kernel_heap, {});
  EXPECT_EQ(second, expected_file(older_binary(kernel), kernel, wanted, 300));
}

TEST(ReplaceKernel, TheSmallestKernel) {
  older_kernel kernel;
  kernel.name.clear();
  for (byte_vector* part :
       {&kernel.kernel_heap, &kernel.general_state, &kernel.dynamic_state, &kernel.surface_state}) {
    part->clear();
  }
  const byte_vector file = older_binary(kernel);
  EXPECT_EQ(replace_kernel(file, byte_view(), byte_view()),
            expected_file(file, kernel, with_code(kernel, {}, {}), 0));
}

TEST(ReplaceKernel, ASectionThatFollowsAtOnceMoves) {
  older_kernel kernel;
  kernel.kernel_heap.resize(301);  // 68 + 11 + 301 + 12 + 20 + 36 bytes end on the alignment
  ASSERT_EQ(program_data(kernel).size() % 16, 0U);
  const byte_vector file = older_binary(kernel);
  ASSERT_EQ(data_at(file, index_of_program + 1),
            data_at(file, index_of_program) + program_data(kernel).size());
  EXPECT_EQ(replace_kernel(file, byte_view(), byte_view()),
            expected_file(file, kernel, with_code(kernel, {}, {}), 0));
}

TEST(ReplaceKernel, SectionsInFrontOfTheProgramStayWhateverTheirNumber) {
  byte_vector file = older_binary({});
  const std::size_t first = section_at(file, 1);
  // Sections 1 (in front) and 3 (behind) change places in the table.
  for (std::size_t i = 0; i < 64; ++i) {
    std::swap(file[first + i], file[first + 128 + i]);
  }
  const byte_vector result = replace_kernel(file, counting(500, 0), byte_vector{});
  EXPECT_EQ(data_at(result, 3), data_at(file, 3));
  EXPECT_EQ(data_at(result, 1), data_at(file, 1) + 768 - 300);
}

TEST(ReplaceKernel, ProgramsThatAreRefused) {
  const byte_vector code(16);
  EXPECT_THROW(replace_kernel(byte_vector(100), code, byte_vector{}), crate::bad_elf);
  EXPECT_THROW(replace_kernel(byte_vector{}, code, byte_vector{}), crate::bad_elf);
  EXPECT_THROW(replace_kernel(newer_binary(26, 0), code, byte_vector{}), crate::no_binary_section);

  const byte_vector whole = older_binary(full_kernel());
  byte_vector file = whole;
  put64(file, at_e_shoff, file.size() - 64);
  EXPECT_THROW(replace_kernel(file, code, byte_vector{}), crate::bad_elf);
  file = whole;
  put64(file, section_at(file, index_of_program) + at_sh_size, 27);
  EXPECT_THROW(replace_kernel(file, code, byte_vector{}), crate::no_binary_section);
  const std::size_t program = data_at(whole, index_of_program);
  for (const std::size_t field : {0, 16, 24}) {  // magic, kernel count, patch list size
    file = whole;
    put32(file, program + field, 2);
    EXPECT_THROW(replace_kernel(file, code, byte_vector{}), crate::bad_binary_section) << field;
  }
}

TEST(ReplaceKernel, SizesThatPassTheEndOfTheFile) {
  const byte_vector whole = older_binary(full_kernel());
  const std::size_t program = data_at(whole, index_of_program);
  for (const std::size_t field : {40, 44, 48, 52, 56, 60}) {
    const std::uint64_t size = get32(whole, program + field);
    for (const std::uint64_t more : {std::uint64_t{whole.size()}, 0xFFFFFFFF - size}) {
      byte_vector file = whole;
      put32(file, program + field, size + more);
      EXPECT_THROW(replace_kernel(file, byte_vector{}, byte_vector{}), crate::bad_binary_section)
          << field << " " << more;
    }
  }
  byte_vector file = whole;
  for (const std::size_t field : {40, 44, 48, 52, 56, 60}) {
    put32(file, program + field, 0xFFFFFFFF);  // their sum has more than 32 bits
  }
  EXPECT_THROW(replace_kernel(file, byte_vector{}, byte_vector{}), crate::bad_binary_section);
}

TEST(ReplaceKernel, TheKernelMayReachTheEndOfTheFileAndNoFurther) {
  older_kernel kernel;
  byte_vector file = elf_file({{"", 1, {}}, {"program", type_program, program_data(kernel)}});
  const std::size_t program = data_at(file, index_of_program);
  file.resize(program + program_data(kernel).size());  // the names behind it go
  EXPECT_NO_THROW(replace_kernel(file, byte_vector{}, byte_vector{}));
  file.pop_back();
  EXPECT_THROW(replace_kernel(file, byte_vector{}, byte_vector{}), crate::bad_binary_section);
}

// What the section header says of the size decides nothing but whether it can be kept right.
TEST(ReplaceKernel, TheFileAloneBoundsTheKernel) {
  const older_kernel kernel = full_kernel();
  const byte_vector whole = older_binary(kernel);
  const std::size_t size_at = section_at(whole, index_of_program) + at_sh_size;
  const std::uint64_t kernel_size = program_data(kernel).size() - kernel.more.size();
  const std::uint64_t to_the_end = whole.size() - data_at(whole, index_of_program);
  const byte_vector code(kernel.kernel_heap.size());  // the heap grows by the room behind it
  for (const std::uint64_t size :
       {std::uint64_t{28}, kernel_size - 1, kernel_size, to_the_end, to_the_end + 1}) {
    byte_vector file = whole;
    put64(file, size_at, size);
    const byte_vector result = replace_kernel(file, code, byte_view());
    EXPECT_EQ(get64(result, size_at) - size, result.size() - file.size()) << size;
  }
  byte_vector file = whole;
  put64(file, size_at, ~std::uint64_t{0} - 1);  // would wrap
  expect_hw(file, 4, 4, 6);
  EXPECT_THROW(replace_kernel(file, code, byte_view()), crate::bad_binary_section);
}

TEST(ReplaceKernel, ASectionThatWouldShrinkBelowItsHeader) {
  older_kernel kernel;
  kernel.kernel_heap = byte_vector(1024);
  byte_vector file = older_binary(kernel);
  const std::size_t size_at = section_at(file, index_of_program) + at_sh_size;
  const std::uint64_t shrinks_by = 1024 - 256;
  put64(file, size_at, 28 + shrinks_by);
  EXPECT_EQ(get64(replace_kernel(file, byte_view(), byte_view()), size_at), 28U);
  put64(file, size_at, 28 + shrinks_by - 1);
  EXPECT_THROW(replace_kernel(file, byte_view(), byte_view()), crate::bad_binary_section);
}

TEST(ReplaceKernel, AKernelHeaderBeyondTheFile) {
  byte_vector file =
      elf_file({{"", 1, {}}, {"program", type_program, program_header({})}}, header_table::first);
  file.resize(data_at(file, index_of_program) + 28);
  expect_hw(file, 4, 4, 6);  // one can tell what it is for, but there is no kernel
  EXPECT_THROW(replace_kernel(file, byte_vector{}, byte_vector{}), crate::bad_binary_section);
}

TEST(ReplaceKernel, AKernelThatOverlapsTheHeaders) {
  // The table lies inside the kernel heap, where the new code would go.
  older_kernel kernel;
  kernel.kernel_heap = byte_vector(1000);
  byte_vector file = older_binary(kernel);
  const std::size_t count = get16(file, at_e_shnum);
  const std::size_t inside = data_at(file, index_of_program) + 200;
  const byte_vector headers = cut(file, 64, 64 + 64 * count);
  std::copy(headers.begin(), headers.end(), &file[inside]);
  put64(file, at_e_shoff, inside);
  repair_checksum(file);
  expect_hw(file, 4, 4, 6);
  EXPECT_THROW(replace_kernel(file, byte_vector{}, byte_vector{}), crate::bad_binary_section);

  // The table, of one entry, overlaps the file header.
  byte_vector low = elf_file(
      {{"", 1, byte_vector(128)}, {"program", type_program, program_data({})}}, header_table::last);
  const std::size_t entry = section_at(low, index_of_program);
  const byte_vector bytes = cut(low, entry, entry + 64);
  std::copy(bytes.begin(), bytes.end(), &low[63]);
  put64(low, at_e_shoff, 63);
  put16(low, at_e_shnum, 1);
  expect_hw(low, 4, 4, 6);
  EXPECT_THROW(replace_kernel(low, byte_vector{}, byte_vector{}), crate::bad_binary_section);

  // The program begins in the last 4 bytes of the file header, so that its magic number is the
  // number of sections as well.
  const byte_vector program = program_data({});
  byte_vector early = cut(elf_file({}), 0, 60);
  append(early, program);
  const std::size_t table = early.size();
  early.resize(table + 64 * std::size_t{0x5242});
  put64(early, at_e_shoff, table);
  put32(early, table + at_sh_type, type_program);
  put64(early, table + at_sh_offset, 60);
  put64(early, table + at_sh_size, program.size());
  expect_hw(early, 4, 4, 6);
  EXPECT_THROW(replace_kernel(early, byte_vector{}, byte_vector{}), crate::bad_binary_section);
}

TEST(ReplaceKernel, EveryByteOfTheKernelIsUnderItsChecksum) {
  const older_kernel kernel = full_kernel();
  const byte_vector whole = older_binary(kernel);
  const std::size_t program = data_at(whole, index_of_program);
  const std::size_t end = program + program_data(kernel).size() - kernel.more.size();
  for (std::size_t at = program + at_kernel_name; at < end; ++at) {
    byte_vector file = whole;
    file[at] ^= 0x10;
    EXPECT_THROW(replace_kernel(file, byte_vector{}, byte_vector{}), crate::invalid_checksum) << at;
  }
  byte_vector file = whole;
  ++file[program + at_kernel_checksum];
  EXPECT_THROW(replace_kernel(file, byte_vector{}, byte_vector{}), crate::invalid_checksum);
  file = whole;
  ++file[end];           // more of the section,
  ++file[program + 32];  // the shader hash
  EXPECT_NO_THROW(replace_kernel(file, byte_vector{}, byte_vector{}));
}

TEST(ReplaceKernel, SizesThatDoNotFitTheirFields) {
  const byte_vector file = older_binary(full_kernel());
  const std::uint8_t byte = 0;  // never read: the sizes are judged first
  for (const std::uint64_t size : {0xFFFFFF00ULL - 63, 0xFFFFFFFFULL, 0x100000000ULL, ~0ULL}) {
    EXPECT_THROW(replace_kernel(file, byte_view(&byte, size), byte_view()), std::length_error)
        << size;
  }
  const std::uint64_t list = get32(file, data_at(file, index_of_program) + at_patch_list_size);
  for (const std::uint64_t size : {0x100000000ULL - list, 0x100000000ULL, ~0ULL}) {
    EXPECT_THROW(replace_kernel(file, byte_view(), byte_view(&byte, size)), std::length_error)
        << size;
  }
}

TEST(ReplaceKernel, ShortForms) {
  const byte_vector whole = older_binary(full_kernel());
  std::size_t refused = 0;
  for (std::size_t size = 0; size < whole.size(); ++size) {
    try {
      replace_kernel(cut(whole, 0, size), counting(40, 0), byte_vector{});
    } catch (const std::runtime_error&) {
      ++refused;
    }
  }
  EXPECT_GE(refused, data_at(whole, index_of_program) + at_kernel_name);
}

}  // namespace
