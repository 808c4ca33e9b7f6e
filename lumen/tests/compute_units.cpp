// SPDX-License-Identifier: Apache-2.0
// A virtual device of one compute unit, where the host has two threads.
#include <atomic>
#include <chrono>
#include <thread>

#include "every_device.hpp"

// More items than chunks, each of them slow enough for helpers to come.
TEST(compute_units, bound_the_threads_of_a_kernel) {
  const std::vector<sycl::device> devices = sycl::device::get_devices();
  ASSERT_EQ(devices.at(1).get_info<sycl::info::device::max_compute_units>(), 1U);
  for (const std::size_t number : host_run_devices()) {
    const sycl::device& device = devices[number];
    const auto units = device.get_info<sycl::info::device::max_compute_units>();
    std::atomic<unsigned> inside{0}, most{0};
    sycl::queue(device)
        .parallel_for(sycl::range<1>(400),
                      [&inside, &most](sycl::id<1>) {
                        const unsigned now = ++inside;
                        unsigned seen = most;
                        while (seen < now && !most.compare_exchange_weak(seen, now)) {
                        }
                        std::this_thread::sleep_for(std::chrono::microseconds(50));
                        --inside;
                      })
        .wait();
    EXPECT_LE(most, units);
    EXPECT_GE(most, 1U);
  }
}
