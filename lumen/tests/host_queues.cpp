// SPDX-License-Identifier: Apache-2.0
// Errors that kernels on host threads throw.
#include <stdexcept>

#include "every_device.hpp"

class host_queues : public on_every_device {};

TEST_P(host_queues, errors_of_kernels_reach_the_handler) {
  std::vector<std::string> texts;
  sycl::queue q(device(), appends_to(texts));
  q.parallel_for(sycl::range<1>(1000), [](sycl::id<1> i) {
     if (i[0] == 617) {
       throw std::runtime_error("range kernel");
     }
   }).wait_and_throw();
  q.parallel_for(sycl::nd_range<1>(512, 64), [](sycl::nd_item<1> i) {
     sycl::group_barrier(i.get_group());
     if (i.get_global_id(0) == 130) {
       throw std::runtime_error("group kernel");
     }
     sycl::group_barrier(i.get_group());
   }).wait_and_throw();
  EXPECT_EQ(texts, (std::vector<std::string>{"range kernel", "group kernel"}));
  q.throw_asynchronous();
  EXPECT_EQ(texts.size(), 2U);
}
LUMEN_ON_HOST_RUN_DEVICES(host_queues);
