// SPDX-License-Identifier: Apache-2.0
// A process with a malformed LUMEN_NUM_THREADS: one line on the error stream at the first use,
// and as many threads as the hardware has.
#include <algorithm>
#include <thread>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

TEST(malformed_number_of_threads, is_reported_once_and_the_default_is_used) {
  testing::internal::CaptureStderr();
  sycl::queue q(sycl::cpu_selector_v);
  const auto units = q.get_device().get_info<sycl::info::device::max_compute_units>();
  EXPECT_EQ(units, std::max(1U, std::thread::hardware_concurrency()));
  int value = 0;
  int* place = &value;
  q.single_task([=] { *place = 5; }).wait();
  EXPECT_EQ(value, 5);
  EXPECT_EQ(testing::internal::GetCapturedStderr(),
            "lumen: LUMEN_NUM_THREADS: column 1: '4x' is not a number from 1 to 4096; the variable "
            "is ignored\n");
}
