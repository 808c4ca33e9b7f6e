// SPDX-License-Identifier: Apache-2.0
// splice_kernel without memory: the program has a tarn_serv_malloc of its own, which stands before
// that of the core library.
#include <cstddef>
#include <cstdint>
#include <tarn_serv.h>

#include <gtest/gtest.h>

#include "binaries.hpp"
#include "splice_kernel.hpp"

namespace {

struct request {
  std::size_t size = 0;
  std::size_t alignment = 0;
  int count = 0;
};
request last_request;

}  // namespace

void* tarn_serv_malloc(std::size_t size, std::size_t alignment) {
  last_request = {size, alignment, last_request.count + 1};
  return nullptr;
}

namespace {

TEST(SpliceKernelWithoutMemory, IsRefusedAfterOneRequestOfTheRightSize) {
  const tarn_test::byte_vector file = tarn_test::older_binary({});
  last_request = {};
  int mark = 0;
  void* out = &mark;
  std::size_t out_size = 7;
  EXPECT_EQ(kestrel::tarn::forge::splice_kernel(file.data(), file.size(), nullptr, 0, nullptr, 0,
                                                &out, &out_size),
            -4);
  EXPECT_EQ(out, nullptr);
  EXPECT_EQ(out_size, 0U);
  EXPECT_EQ(last_request.size, file.size() - 300 + 256);
  EXPECT_EQ(last_request.alignment, 16U);
  EXPECT_EQ(last_request.count, 1);
}

TEST(SpliceKernelWithoutMemory, AFileThatIsRefusedAsksForNone) {
  tarn_test::byte_vector file = tarn_test::older_binary({});
  ++file[tarn_test::data_at(file, tarn_test::index_of_program) + tarn_test::at_kernel_name];
  last_request = {};
  void* out = nullptr;
  std::size_t out_size = 7;
  EXPECT_EQ(kestrel::tarn::forge::splice_kernel(file.data(), file.size(), nullptr, 0, nullptr, 0,
                                                &out, &out_size),
            -5);
  EXPECT_EQ(last_request.count, 0);
}

}  // namespace
