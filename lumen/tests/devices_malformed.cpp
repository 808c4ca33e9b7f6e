// SPDX-License-Identifier: Apache-2.0
// A process with a malformed LUMEN_VIRTUAL_DEVICES: one line on the error stream at the first
// enumeration, and no device on the host's threads but the host.
#include "every_device.hpp"

TEST(malformed_virtual_devices, are_reported_once_and_leave_the_host_alone) {
  testing::internal::CaptureStderr();
  EXPECT_EQ(host_run_devices(), std::vector<std::size_t>{0});
  EXPECT_EQ(host_run_devices(), std::vector<std::size_t>{0});
  EXPECT_FALSE(sycl::queue().get_device().has(sycl::aspect::emulated));
  EXPECT_EQ(testing::internal::GetCapturedStderr(),
            "lumen: LUMEN_VIRTUAL_DEVICES: column 23: 'compute_units' takes a number from 1 to "
            "65536; no virtual device is made\n");
}
