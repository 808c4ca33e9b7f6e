// SPDX-License-Identifier: Apache-2.0
// Kernels of a unit without CUDA code: CUDA devices refuse them at once, and stay usable. On
// virtual devices with streams their reductions and errors come in time for what follows them.
#include <chrono>
#include <cstdlib>
#include <stdexcept>
#include <thread>

#include "every_device.hpp"

TEST(host_only_kernels, are_refused_by_cuda_devices) {
  bool found = false;
  for (const sycl::device& device : sycl::device::get_devices()) {
    if (device.get_backend() == sycl::backend::cuda) {
      found = true;
      sycl::queue q(device);
      const auto unsupported = sycl::errc::kernel_not_supported;
      EXPECT_EQ(code_of([&] { q.single_task([] {}); }), unsupported);
      EXPECT_EQ(code_of([&] { q.parallel_for(sycl::range<2>(3, 4), [](sycl::id<2>) {}); }),
                unsupported);
      EXPECT_EQ(code_of([&] { q.parallel_for(sycl::nd_range<1>(8, 4), nothing()); }), unsupported);
      const shared_array<int> sum(1, q, 5);
      EXPECT_EQ(code_of([&] {
                  q.parallel_for(sycl::range<1>(4), sycl::reduction(sum.data(), sycl::plus<int>()),
                                 [](sycl::id<1>, auto& s) { s += 1; });
                }),
                unsupported);
      q.submit([&](sycl::handler& h) { h.host_task([&] { sum[0] += 1; }); }).wait();
      EXPECT_EQ(sum[0], 6);
    }
  }
  if (!found) {
    GTEST_SKIP() << "no CUDA device";
  }
}

class host_kernels_in_streams : public on_every_device {};

TEST_P(host_kernels_in_streams, reductions_are_there_for_the_next_kernel) {
  sycl::queue q = in_order();
  const shared_array<long> sum(1, q);
  const shared_array<long> seen(1, q);
  long* const total = sum.data();
  long* const copy = seen.data();
  for (int round = 0; round < 50; ++round) {
    *total = round;
    q.parallel_for(sycl::range<1>(1000), sycl::reduction(total, sycl::plus<long>()),
                   [](sycl::id<1> i, auto& s) { s += static_cast<long>(i[0]); });
    q.single_task([=] { *copy = *total; }).wait();
    ASSERT_EQ(*copy, round + 999L * 500);
  }
}

TEST_P(host_kernels_in_streams, whoever_waits_for_a_kernel_hears_of_those_before_it) {
  for (int round = 0; round < 50; ++round) {
    std::vector<std::string> texts;
    sycl::queue q(device(), appends_to(texts));
    sycl::event first = q.single_task([] { throw std::runtime_error("first"); });
    sycl::event second = q.single_task(first, [] {});
    sycl::event third = q.single_task(second, [] {});
    third.wait_and_throw();
    ASSERT_EQ(texts, std::vector<std::string>{"first"});
    for (const sycl::event& e : {first, second, third}) {
      ASSERT_EQ(e.get_info<sycl::info::event::command_execution_status>(),
                sycl::info::event_command_status::complete);
    }
  }
}
LUMEN_ON_HOST_RUN_DEVICES(host_kernels_in_streams);

// The handler of a queue that is gone runs on the thread that looks after the streams.
TEST(host_kernels_in_streams_deathtest, a_handler_may_end_the_process) {
  testing::FLAGS_gtest_death_test_style = "threadsafe";
  const auto leave = [] {
    for (const std::size_t number : host_run_devices()) {
      const sycl::device device = sycl::device::get_devices()[number];
      if (has_own_memory(device)) {
        sycl::queue q(device, [](sycl::exception_list) { std::exit(7); });
        sycl::event failing = q.single_task([] { throw std::runtime_error("fails"); });
        q.single_task(failing, [] { throw std::runtime_error("fails as well"); });
        q.single_task([] {});
      }
    }
    std::this_thread::sleep_for(std::chrono::seconds(20));
    std::exit(1);
  };
  EXPECT_EXIT(leave(), testing::ExitedWithCode(7), "");
}
