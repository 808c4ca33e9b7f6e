// SPDX-License-Identifier: Apache-2.0
// Records of kernel arguments as the setters of all layers fill them.
#include <cstring>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "from_c.h"
#include "kernel_argument.hpp"
#include "kestrel/tarn/gpu/launch.hpp"

namespace {

namespace gpu = kestrel::tarn::gpu;

constexpr unsigned char marker = 0xa5;

// A record between two others, all of them marked.
class launch_arguments : public testing::Test {
 protected:
  launch_arguments() { std::memset(records, marker, sizeof records); }
  void TearDown() override {
    const std::vector<unsigned char> untouched(sizeof records[0], marker);
    EXPECT_EQ(std::memcmp(&records[0], untouched.data(), untouched.size()), 0);
    EXPECT_EQ(std::memcmp(&records[2], untouched.data(), untouched.size()), 0);
  }

  template <typename T>
  T value() const {
    return gpu::value_of<T>(arg);
  }
  // Kind, size and access, which may lie at any address.
  std::vector<long> fields() const { return {long{arg.kind}, long{arg.size}, long{arg.access}}; }

  tarn_gpu_argument_t records[3];
  tarn_gpu_argument_t& arg = records[1];
};

using fields_of = std::vector<long>;

TEST_F(launch_arguments, a_buffer_keeps_its_access_in_both_layers) {
  sycl::buffer<char, 1> buffer{sycl::range<1>(4)};
  auto* const handle = reinterpret_cast<_cl_mem*>(&buffer);
  for (const tarn_gpu_access_t access :
       {TARN_GPU_ACCESS_READ, TARN_GPU_ACCESS_WRITE, TARN_GPU_ACCESS_READ_WRITE}) {
    gpu::set_buffer_arg(&arg, &buffer, access);
    EXPECT_EQ(fields(), (fields_of{1, 8, access}));
    EXPECT_EQ(value<void*>(), &buffer);
    std::memset(&arg, marker, sizeof arg);
    tarn_serv_gpu_set_buffer_arg(&arg, handle, access);
    EXPECT_EQ(fields(), (fields_of{1, 8, access}));
    EXPECT_EQ(value<_cl_mem*>(), handle);
  }
}

TEST_F(launch_arguments, a_pointer_is_read_and_written_whatever_the_caller_says) {
  int place = 0;
  const auto expect_pointer = [&](const char* setter) {
    EXPECT_EQ(fields(), (fields_of{2, 8, 2})) << setter;
    EXPECT_EQ(value<int*>(), &place) << setter;
    std::memset(&arg, marker, sizeof arg);
  };
  gpu::tarn_gpu_set_usm_arg(&arg, &place);
  expect_pointer("C++");
  gpu::set_buffer_arg_usm(&arg, &place, TARN_GPU_ACCESS_READ);
  expect_pointer("set_buffer_arg_usm");
  ::tarn_gpu_set_usm_arg(&arg, &place);
  expect_pointer("C");
}

TEST_F(launch_arguments, local_memory_is_a_number_of_bytes) {
  gpu::set_SLM_arg(&arg, 0x123456789);
  EXPECT_EQ(fields(), (fields_of{3, 8, 2}));
  EXPECT_EQ(value<std::uint64_t>(), 0x123456789u);
  std::memset(&arg, marker, sizeof arg);
  tarn_serv_gpu_set_SLM_arg(&arg, 0x123456789);
  EXPECT_EQ(fields(), (fields_of{3, 8, 2}));
  EXPECT_EQ(value<std::uint64_t>(), 0x123456789u);
}

// Sizes, what is stored of each, and which of the two setters take it.
struct scalar_case {
  long size;
  std::size_t stored;
};

class scalars : public launch_arguments, public testing::WithParamInterface<scalar_case> {
 protected:
  void expect_stored() const {
    const std::size_t stored = GetParam().stored;
    EXPECT_EQ(fields(), (fields_of{0, static_cast<long>(stored), 2}));
    EXPECT_EQ(std::memcmp(arg.value, bytes, stored), 0);
    for (std::size_t i = stored; i < sizeof arg.value; ++i) {
      EXPECT_EQ(arg.value[i], marker) << "byte " << i << " is none of the value's";
    }
  }

  const unsigned char bytes[8] = {1, 2, 3, 4, 5, 6, 7, 8};  // no setter may read on
};

TEST_P(scalars, are_stored_in_the_c_layer) {
  tarn_serv_gpu_set_scalar_arg_internal(&arg, bytes, static_cast<int>(GetParam().size));
  expect_stored();
}

TEST_P(scalars, are_stored_in_the_cpp_layer) {
  gpu::set_scalar_arg_internal(&arg, bytes, static_cast<std::size_t>(GetParam().size));
  expect_stored();
}

INSTANTIATE_TEST_SUITE_P(of_every_size, scalars,
                         testing::Values(scalar_case{0, 0}, scalar_case{1, 1}, scalar_case{2, 2},
                                         scalar_case{3, 3}, scalar_case{4, 4}, scalar_case{7, 7},
                                         scalar_case{8, 8}, scalar_case{9, 8}, scalar_case{12, 8},
                                         scalar_case{16, 8}, scalar_case{2147483647, 8},
                                         scalar_case{-1, 8}, scalar_case{-2147483647, 8}),
                         [](const auto& each) {
                           const long size = each.param.size;
                           return size < 0 ? "minus_" + std::to_string(-size)
                                           : std::to_string(size);
                         });

TEST_F(launch_arguments, a_value_of_16_bytes_is_the_first_16_of_the_record) {
  const unsigned char value_bytes[8] = {1, 2, 3, 4, 5, 6, 7, 8};
  tarn_serv_gpu_set_scalar_arg_internal(&arg, value_bytes, 8);
  arg.size = 16;
  struct two_words {
    std::uint64_t low;
    std::uint64_t high;
  };
  const auto both = value<two_words>();
  EXPECT_EQ(both.low, 0x0807060504030201u);
  EXPECT_EQ(both.high, std::uint64_t{16} << 32);  // kind 0, size 16
}

// A translation unit in C fills the same records: the header is C, and its layout is that of C++.
TEST_F(launch_arguments, look_the_same_in_c) {
  int place = 0;
  tarn_gpu_argument_t from_c[4];
  std::memset(from_c, marker, sizeof from_c);
  fill_from_c(from_c, &place);
  EXPECT_EQ(from_c[0].kind, 0u);
  EXPECT_EQ(from_c[0].size, 4u);
  EXPECT_EQ(gpu::value_of<std::uint32_t>(from_c[0]), 0xdeadbeefu);
  EXPECT_EQ(from_c[1].kind, 2u);
  EXPECT_EQ(gpu::value_of<int*>(from_c[1]), &place);
  EXPECT_EQ(from_c[2].kind, 3u);
  EXPECT_EQ(gpu::value_of<std::uint64_t>(from_c[2]), 256u);
  EXPECT_EQ(from_c[3].kind, 7u);
  EXPECT_EQ(from_c[3].access, 9);
  static_assert(sizeof from_c == 80, "20 bytes each, nothing between them");
}

}  // namespace
