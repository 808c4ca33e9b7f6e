// SPDX-License-Identifier: Apache-2.0
// In a process under the audit library there are no native drivers: the loader of each exists for
// the machine at most.
#include <dlfcn.h>

#include <gtest/gtest.h>

namespace {

class no_drivers : public testing::TestWithParam<const char*> {};

TEST_P(no_drivers, are_found_by_any_of_their_names) {
  EXPECT_EQ(::dlopen(GetParam(), RTLD_NOW | RTLD_LOCAL), nullptr);
}
INSTANTIATE_TEST_SUITE_P(names, no_drivers,
                         testing::Values("libOpenCL.so.1", "libOpenCL.so", "libze_loader.so.1",
                                         "libomptarget.so",
                                         "/usr/lib/x86_64-linux-gnu/libOpenCL.so.1"));

TEST(no_drivers, hides_nothing_else) {
  EXPECT_NE(::dlopen("libm.so.6", RTLD_NOW | RTLD_LOCAL), nullptr);
}

}  // namespace
