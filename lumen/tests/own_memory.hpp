// SPDX-License-Identifier: Apache-2.0
// What the suites about devices with memory of their own share: devices beside one another, and
// arithmetic that shows how often, and in which order, it was done.
#pragma once

#include <cstddef>
#include <vector>

#include "every_device.hpp"

// Each device meets those after it in the list, the last one the host.
class beside_others : public on_every_device {
 protected:
  sycl::device neighbour(std::size_t distance = 1) const {
    const std::vector<sycl::device> devices = sycl::device::get_devices();
    return devices[(GetParam() + distance) % devices.size()];
  }
};

using number = unsigned;

// A linear congruential generator (Knuth, TAOCP volume 2, section 3.3.4, line 16 of table 1).
SYCL_EXTERNAL inline number stepped(number x, int rounds = 1) {
  for (int r = 0; r < rounds; ++r) {
    x = x * 1664525 + 1013904223;
  }
  return x;
}
