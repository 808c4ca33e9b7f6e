// SPDX-License-Identifier: Apache-2.0
// splice_kernel: the numbers of its faults, and its result against that of replace_kernel, from
// which it may differ in two things.
#include <cstddef>
#include <cstdint>
#include <tarn_serv.h>

#include <gtest/gtest.h>

#include "binaries.hpp"
#include "replace_kernel.hpp"
#include "splice_kernel.hpp"

namespace {

using namespace tarn_test;
using kestrel::tarn::forge::replace_kernel;
using kestrel::tarn::forge::splice_kernel;

struct outcome {
  int status;
  byte_vector result;
};

/// The results are marked beforehand, and have to be overwritten in any case.
outcome splice(const byte_vector& file, const byte_vector& code, const byte_vector& patches) {
  int mark = 0;
  void* out = &mark;
  std::size_t out_size = 12345;
  const int status = splice_kernel(file.data(), file.size(), code.data(), code.size(),
                                   patches.data(), patches.size(), &out, &out_size);
  if (status != 0) {
    EXPECT_EQ(out, nullptr);
    EXPECT_EQ(out_size, 0U);
    return {status, {}};
  }
  EXPECT_NE(out, nullptr);
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(out) % 16, 0U);
  const auto* bytes = static_cast<const std::uint8_t*>(out);
  byte_vector result(bytes, bytes + out_size);
  tarn_serv_free(out);
  return {status, result};
}

int status_of(const byte_vector& file) {
  return splice(file, counting(32, 0), {}).status;
}

older_kernel with_patches(const byte_vector& patch_list) {
  older_kernel kernel;
  kernel.patch_list = patch_list;
  return kernel;
}

/// What replace_kernel makes of the file once its own sections have a plain type.
byte_vector replaced_plain(byte_vector file, const byte_vector& code, const byte_vector& patches) {
  put32(file, section_at(file, 1) + at_sh_type, type_strings);
  put32(file, section_at(file, 3) + at_sh_type, type_strings);
  return replace_kernel(file, code, patches);
}

TEST(SpliceKernel, AsReplaceKernelButForSectionTypes) {
  for (const header_table table : {header_table::first, header_table::last}) {
    const byte_vector file = older_binary(with_patches(patch_token(7, counting(8, 1))), table);
    ASSERT_EQ(get32(file, section_at(file, 1) + at_sh_type), type_driver_own);
    ASSERT_EQ(get32(file, section_at(file, 3) + at_sh_type), type_driver_own);
    const byte_vector code = counting(600, 9);
    const byte_vector patches = patch_token(5, counting(12, 2));
    const outcome spliced = splice(file, code, patches);
    EXPECT_EQ(spliced.status, 0);
    EXPECT_EQ(spliced.result, replaced_plain(file, code, patches));
  }
}

/// The patch list, and what it has to become.
void expect_tokens(const byte_vector& list, const byte_vector& cleared) {
  ASSERT_EQ(list.size(), cleared.size());
  const byte_vector code = counting(100, 9);
  // The caller's own patches are left as they are.
  const byte_vector patches = patch_token(52, counting(16, 77));
  const outcome spliced = splice(older_binary(with_patches(list)), code, patches);
  EXPECT_EQ(spliced.status, 0);
  EXPECT_EQ(spliced.result, replaced_plain(older_binary(with_patches(cleared)), code, patches));
}

TEST(SpliceKernel, TokensOfType52AreCleared) {
  byte_vector list = patch_token(51, counting(12, 1));
  append(list, patch_token(52, counting(20, 21)));
  append(list, patch_token(53, counting(4, 51)));
  append(list, patch_token(52, {}));
  append(list, patch_token(52, counting(3, 61)));  // sizes need not be multiples of 4
  append(list, patch_token(1, counting(8, 81)));
  byte_vector cleared = patch_token(51, counting(12, 1));
  append(cleared, patch_token(52, byte_vector(20)));
  append(cleared, patch_token(53, counting(4, 51)));
  append(cleared, patch_token(52, {}));
  append(cleared, patch_token(52, byte_vector(3)));
  append(cleared, patch_token(1, counting(8, 81)));
  expect_tokens(list, cleared);
}

TEST(SpliceKernel, ATokenThatPassesTheEndIsCutThere) {
  for (const std::uint64_t size : {29ULL, 1000ULL, 0xFFFFFFFFULL}) {
    byte_vector list = patch_token(52, counting(20, 21));
    byte_vector cleared = patch_token(52, byte_vector(20));
    put32(list, 4, size);
    put32(cleared, 4, size);
    expect_tokens(list, cleared);
    put32(list, 0, 53);  // and so does one of another type end the walk
    put32(list, 8, 52);
    put32(list, 12, 8);
    expect_tokens(list, list);
  }
}

TEST(SpliceKernel, HalfATokenAtTheEndIsLeft) {
  byte_vector list = patch_token(52, counting(4, 21));
  append(list, {52, 0, 0, 0, 8, 0, 0});
  byte_vector cleared = patch_token(52, byte_vector(4));
  append(cleared, {52, 0, 0, 0, 8, 0, 0});
  expect_tokens(list, cleared);
}

TEST(SpliceKernel, ATokenBelowItsOwnHeaderEndsTheWalk) {
  for (const std::uint64_t size : {0ULL, 1ULL, 4ULL, 7ULL}) {
    byte_vector list = patch_token(52, counting(4, 21));
    append(list, patch_token(52, {}));
    append(list, patch_token(52, counting(8, 21)));
    put32(list, 16, size);
    byte_vector cleared = list;
    put32(cleared, 8, 0);
    expect_tokens(list, cleared);
  }
}

TEST(SpliceKernel, NoElf) {
  const byte_vector file = older_binary({});
  EXPECT_EQ(status_of({}), -1);
  EXPECT_EQ(status_of({0x7F, 'E', 'L', 'F'}), -1);
  byte_vector other = file;
  other[3] = 'f';
  EXPECT_EQ(status_of(other), -1);
  other = file;
  put64(other, at_e_shoff, file.size() - 64);  // section headers outside the file
  EXPECT_EQ(status_of(other), -1);
}

TEST(SpliceKernel, NullPointers) {
  const byte_vector file = older_binary({});
  int mark = 0;
  void* out = &mark;
  std::size_t size = 7;
  EXPECT_EQ(splice_kernel(nullptr, file.size(), nullptr, 0, nullptr, 0, &out, &size), -1);
  EXPECT_EQ(out, nullptr);
  EXPECT_EQ(size, 0U);
  const std::size_t whole = file.size();
  EXPECT_EQ(splice_kernel(file.data(), whole, nullptr, 1, nullptr, 0, &out, &size), -1);
  EXPECT_EQ(splice_kernel(file.data(), whole, nullptr, 0, nullptr, 1, &out, &size), -1);
  EXPECT_EQ(splice_kernel(file.data(), whole, nullptr, 0, nullptr, 0, nullptr, &size), -1);
  EXPECT_EQ(splice_kernel(file.data(), whole, nullptr, 0, nullptr, 0, &out, nullptr), -1);
  EXPECT_EQ(splice_kernel(file.data(), whole, nullptr, 0, nullptr, 0, &out, &size), 0);
  EXPECT_EQ(size, file.size() - 300 + 256);
  tarn_serv_free(out);
}

TEST(SpliceKernel, NoProgram) {
  EXPECT_EQ(status_of(newer_binary(26, 0)), -2);
  byte_vector file = older_binary({});
  put64(file, section_at(file, index_of_program) + at_sh_size, 27);
  EXPECT_EQ(status_of(file), -2);
}

TEST(SpliceKernel, BadProgram) {
  const byte_vector whole = older_binary({});
  const std::size_t program = data_at(whole, index_of_program);
  for (const std::size_t field : {0, 16, 24, 40, 44, 48, 52, 56, 60}) {
    byte_vector file = whole;
    put32(file, program + field, 0x7FFFFFFF);
    EXPECT_EQ(status_of(file), -3) << field;
  }
}

TEST(SpliceKernel, BadChecksum) {
  byte_vector file = older_binary({});
  ++file[data_at(file, index_of_program) + at_kernel_name];
  EXPECT_EQ(status_of(file), -5);
  repair_checksum(file);
  EXPECT_EQ(status_of(file), 0);
}

TEST(SpliceKernel, SizesThatDoNotFitTheirFields) {
  const byte_vector file = older_binary({});
  const std::uint8_t byte = 0;  // never read: the sizes are judged first
  int mark = 0;
  for (const std::size_t size : {std::size_t{0xFFFFFF00 - 63}, SIZE_MAX}) {
    void* out = &mark;
    std::size_t out_size = 7;
    EXPECT_EQ(splice_kernel(file.data(), file.size(), &byte, size, nullptr, 0, &out, &out_size),
              -4);
    EXPECT_EQ(out, nullptr);
    EXPECT_EQ(out_size, 0U);
  }
}

}  // namespace
