// SPDX-License-Identifier: Apache-2.0
// Kernels of a unit without CUDA code: CUDA devices refuse them at once, and stay usable.
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
