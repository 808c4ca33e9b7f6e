// SPDX-License-Identifier: Apache-2.0
// What the suites about work on OpenCL devices share: a kernel that shows how often it ran, and
// queues of both kinds.
#pragma once

#include <utility>

#include "native_opencl.hpp"

using number = unsigned;

// Elements that each kernel works on.
constexpr std::size_t size = 500;

constexpr const char* step_source = R"(
  // A linear congruential generator (Knuth, TAOCP volume 2, section 3.3.4, line 16 of table 1).
  kernel void steps(global uint* a, uint rounds) {
    uint x = a[get_global_id(0)];
    for (uint r = 0; r < rounds; ++r) x = x * 1664525 + 1013904223;
    a[get_global_id(0)] = x;
  }
)";

inline number stepped(number x, number rounds) {
  for (number r = 0; r < rounds; ++r) {
    x = x * 1664525 + 1013904223;
  }
  return x;
}

// One context with its kernel.
struct workshop {
  workshop(const sycl::context& owner, sycl::kernel its) : context(owner), kernel(std::move(its)) {}

  sycl::event step(sycl::queue& queue, number* values, number rounds,
                   const std::vector<sycl::event>& after = {}) const {
    return queue.submit([&](sycl::handler& h) {
      h.depends_on(after);
      h.set_args(values, rounds);
      h.parallel_for(sycl::range<1>(size), kernel);
    });
  }
  void step(sycl::queue& queue, sycl::buffer<number>& values, number rounds) const {
    queue.submit([&](sycl::handler& h) {
      h.set_args(sycl::accessor<number, 1, sycl::access_mode::read_write>(values, h), rounds);
      h.parallel_for(sycl::range<1>(size), kernel);
    });
  }

  sycl::context context;
  sycl::kernel kernel;
};

class opencl_work : public native_opencl {
 protected:
  static workshop new_workshop() { return new_workshop(sycl::context(device())); }
  static workshop new_workshop(const sycl::context& context) {
    return {context, make_kernel(context, step_source, "steps")};
  }
  static sycl::queue queue_of(const workshop& shop, const sycl::property_list& properties = {}) {
    return {shop.context, device(), properties};
  }
  static sycl::queue native_queue_of(const workshop& shop, cl_command_queue_properties wanted) {
    const native<cl_context> context = native_context(shop.context);
    const native<cl_command_queue> made = new_queue(context.get(), id_of(device()), wanted);
    return sycl::make_queue<opencl>(made.get(), shop.context);
  }
};
