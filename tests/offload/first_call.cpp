// SPDX-License-Identifier: Apache-2.0
// A process finds the offload runtime at the first call that passes the look at its parameters, and
// not before. Nothing else here loads it.
#include <dlfcn.h>
#include <tarn_rvx_offload.h>

#include <gtest/gtest.h>

#include "caller_stream.hpp"

namespace {

bool is_loaded() {
  void* const library = ::dlopen("libomptarget.so", RTLD_NOW | RTLD_NOLOAD);
  return library != nullptr && ::dlclose(library) == 0;
}

TEST(offload_first_call, loads_the_runtime_unless_it_is_refused_for_its_parameters) {
  const tarn_test::caller_stream stream(RVX_BRNG_PHILOX4X32X10, {5});
  float value = -1;
  const auto status_of = [&](std::int32_t method, float a, float b) {
    return tarn_rvx_vsRngUniform_omp_offload_lp64(method, stream, 1, &value, a, b, nullptr);
  };
  EXPECT_FALSE(is_loaded());
  EXPECT_EQ(status_of(0, 1, 1), -3);
  EXPECT_FALSE(is_loaded());
  EXPECT_EQ(status_of(1, 0, 1), -3);
  EXPECT_FALSE(is_loaded());
  EXPECT_EQ(status_of(0, 0, 1), -2) << "there is no interop object";
  EXPECT_TRUE(is_loaded());
  EXPECT_EQ(value, -1);
}

}  // namespace
