// SPDX-License-Identifier: Apache-2.0
// Kernels over ranges that only host threads run: lambdas, exceptions, reductions.
#include "every_device.hpp"

class host_kernels : public on_every_device {};

TEST_P(host_kernels, lambdas_with_all_forms_of_the_argument_are_taken) {
  sycl::queue q = in_order();
  const shared_array<int> values(5, q);
  int* out = values.data();
  q.parallel_for(1, [=](sycl::item<1> i) { out[i] = static_cast<int>(i.get_id(0)) + 1; });
  q.parallel_for(sycl::range<1>(1), [=](int i) { out[1] = i + 2; });
  q.parallel_for<class named_lambda>(sycl::range<1>(1),
                                     [=](auto i) { out[2] = static_cast<int>(i[0]) + 3; });
  q.parallel_for(sycl::range<1>(1), [=](std::size_t i) { out[3] = static_cast<int>(i) + 4; });
  q.single_task<class lone_lambda>([=] { out[4] = 5; });
  q.wait();
  EXPECT_EQ(values.values(), (std::vector<int>{1, 2, 3, 4, 5}));
}

TEST_P(host_kernels, the_largest_legal_range_is_accepted) {
  // The kernel stops itself by an error at the first item: only acceptance is at stake.
  bool told = false;
  sycl::queue quiet(device(), [&](sycl::exception_list) { told = true; });
  quiet.parallel_for(sycl::range<1>((std::size_t{1} << 31) - 1), [](sycl::id<1>) { throw 1; })
      .wait_and_throw();
  EXPECT_TRUE(told);
}

TEST_P(host_kernels, reductions_combine_all_items) {
  sycl::queue q(device());
  const shared_array<long> sum(1, q, 1000);
  const shared_array<int> most(1, q, -1);
  q.parallel_for(sycl::range<1>(10000), sycl::reduction(sum.data(), sycl::plus<>()),
                 sycl::reduction(most.data(), sycl::maximum<int>()),
                 [=](sycl::id<1> i, auto& s, auto& m) {
                   s += static_cast<long>(i[0]);
                   m.combine(static_cast<int>(i[0] * 7919 % 10007));
                 })
      .wait();
  int expected = -1;
  for (int i = 0; i < 10000; ++i) {
    expected = std::max(expected, i * 7919 % 10007);
  }
  EXPECT_EQ(sum[0], 1000 + 10000L * 9999 / 2);
  EXPECT_EQ(most[0], expected);
  q.parallel_for(sycl::nd_range<1>(1024, 64),
                 sycl::reduction(sum.data(), sycl::plus<long>(),
                                 sycl::property::reduction::initialize_to_identity()),
                 [=](sycl::nd_item<1> i, auto& s) {
                   sycl::group_barrier(i.get_group());
                   s += static_cast<long>(i.get_global_id(0));
                 })
      .wait();
  EXPECT_EQ(sum[0], 1024L * 1023 / 2);
}
LUMEN_ON_HOST_RUN_DEVICES(host_kernels);
