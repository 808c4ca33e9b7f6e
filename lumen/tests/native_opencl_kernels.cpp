// SPDX-License-Identifier: Apache-2.0
// Native OpenCL kernels as SYCL kernels: arguments of every kind, sizes and places of the items.
#include <array>
#include <cstdint>
#include <numeric>

#include "native_opencl.hpp"

namespace {

const char* const source = R"(
  struct pair { int a; float b; };
  kernel void store_values(global double* out, char c, short s, int i, long l, float f, double d,
                           struct pair p) {
    out[0] = c; out[1] = s; out[2] = i; out[3] = l; out[4] = f; out[5] = d; out[6] = p.a;
    out[7] = p.b;
  }
  kernel void scale(global const float* x, global float* y, float a) {
    y[get_global_id(0)] = a * x[get_global_id(0)];
  }
  kernel void is_null(global int* maybe, global int* out) { *out = maybe == 0; }
  kernel void reverse_groups(global int* values, local int* scratch) {
    const size_t i = get_local_id(0);
    scratch[i] = values[get_global_id(0)];
    barrier(CLK_LOCAL_MEM_FENCE);
    values[get_global_id(0)] = scratch[get_local_size(0) - 1 - i];
  }
  kernel void positions(global ulong* out, ulong width, ulong depth) {
    const size_t x = get_global_id(0) - get_global_offset(0);
    const size_t y = get_global_id(1) - get_global_offset(1);
    const size_t z = get_global_id(2) - get_global_offset(2);
    global ulong* const place = out + 9 * ((z * depth + y) * width + x);
    for (int d = 0; d < 3; ++d) {
      place[d] = get_global_id(d);
      place[3 + d] = get_local_size(d);
      place[6 + d] = get_global_size(d);
    }
  }
)";

class opencl_queue : public native_opencl {
 protected:
  void SetUp() override {
    native_opencl::SetUp();
    if (!IsSkipped()) {
      context_.emplace_back(device());
      queue_.emplace_back(context_[0], device(), sycl::property::queue::in_order());
    }
  }
  void TearDown() override {
    queue_.clear();
    context_.clear();
    native_opencl::TearDown();
  }
  sycl::queue& queue() { return queue_[0]; }
  sycl::kernel kernel(const char* name) { return make_kernel(context_[0], source, name); }
  template <typename T>
  T* shared(std::size_t count) {
    T* const made = sycl::malloc_shared<T>(count, queue());
    EXPECT_NE(made, nullptr);
    std::fill_n(made, count, T(77));
    return made;
  }

 private:
  std::vector<sycl::context> context_;
  std::vector<sycl::queue> queue_;
};

struct pair {
  int a;
  float b;
};

TEST_F(opencl_queue, a_kernel_gets_values_of_every_size) {
  double* const out = shared<double>(8);
  queue()
      .submit([&](sycl::handler& h) {
        h.set_args(out, std::int8_t{-5}, std::int16_t{-300}, std::int32_t{-70000},
                   std::int64_t{-5000000000}, 0.5f, 1e300, pair{9, 0.25f});
        h.single_task(kernel("store_values"));
      })
      .wait_and_throw();
  EXPECT_EQ(std::vector<double>(out, out + 8),
            (std::vector<double>{-5, -300, -70000, -5e9, 0.5, 1e300, 9, 0.25}));
  sycl::free(out, queue());
}

TEST_F(opencl_queue, what_is_not_set_again_keeps_its_value) {
  constexpr std::size_t size = 100;
  float* const x = shared<float>(size);
  float* const y = shared<float>(size);
  std::iota(x, x + size, 0.0f);
  const sycl::kernel scale = kernel("scale");
  queue().submit([&](sycl::handler& h) {
    h.set_args(x, y, 2.0f);
    h.parallel_for(sycl::range<1>(size), scale);
  });
  queue().submit([&](sycl::handler& h) {
    h.set_arg(0, y);
    h.set_arg(2, 3.0f);
    h.parallel_for(sycl::range<1>(size), scale);
  });
  queue().wait_and_throw();
  for (std::size_t i = 0; i < size; ++i) {
    ASSERT_EQ(y[i], 6.0f * static_cast<float>(i));
  }
  sycl::free(x, queue());
  sycl::free(y, queue());
}

TEST_F(opencl_queue, a_pointer_may_be_null_or_lie_inside_an_allocation) {
  int* const out = shared<int>(2);
  const sycl::kernel is_null = kernel("is_null");
  const auto ask = [&](int* pointer) {
    queue()
        .submit([&](sycl::handler& h) {
          h.set_args(pointer, out + 1);
          h.single_task(is_null);
        })
        .wait_and_throw();
    return out[1];
  };
  EXPECT_EQ(ask(nullptr), 1);
  EXPECT_EQ(ask(out), 0);
  EXPECT_EQ(ask(nullptr), 1);
  EXPECT_EQ(out[0], 77);
  sycl::free(out, queue());
}

TEST_F(opencl_queue, groups_share_local_memory) {
  constexpr std::size_t group = 16, groups = 5, size = group * groups;
  int* const values = shared<int>(size);
  std::iota(values, values + size, 0);
  queue()
      .submit([&](sycl::handler& h) {
        const sycl::local_accessor<int> scratch(sycl::range<1>(group), h);
        h.set_args(values, scratch);
        h.parallel_for(sycl::nd_range<1>(size, group), kernel("reverse_groups"));
      })
      .wait_and_throw();
  for (std::size_t i = 0; i < size; ++i) {
    ASSERT_EQ(values[i], static_cast<int>(i / group * group + (group - 1 - i % group)));
  }
  sycl::free(values, queue());
}

TEST_F(opencl_queue, a_kernel_works_on_a_buffer) {
  constexpr std::size_t size = 1000;
  std::vector<float> values(size);
  std::iota(values.begin(), values.end(), 0.0f);
  {
    sycl::buffer<float> x(values.data(), size);
    sycl::buffer<float> y{sycl::range<1>(size)};
    const sycl::kernel scale = kernel("scale");
    const auto run = [&](sycl::buffer<float>& from, sycl::buffer<float>& to, float by) {
      queue().submit([&](sycl::handler& h) {
        h.set_args(sycl::accessor<float, 1, sycl::access_mode::read>(from, h),
                   sycl::accessor<float, 1, sycl::access_mode::write>(to, h), by);
        h.parallel_for(sycl::range<1>(size), scale);
      });
    };
    run(x, y, 2.0f);
    run(y, x, 5.0f);
    const sycl::host_accessor middle(y, sycl::read_only);
    EXPECT_EQ(middle[size - 1], 2.0f * static_cast<float>(size - 1));
  }
  for (std::size_t i = 0; i < size; ++i) {
    ASSERT_EQ(values[i], 10.0f * static_cast<float>(i));
  }
}

// The last dimension of SYCL is the first of OpenCL.
class positions : public opencl_queue {
 protected:
  using triple = std::array<std::size_t, 3>;  // in the order of SYCL, ones in front

  // What each item of a launch says, checked against the sizes.
  template <typename Launch>
  void check(const triple& global, const triple& local, const triple& offset,
             const Launch& launch) {
    const std::size_t total = global[0] * global[1] * global[2];
    auto* const out = shared<std::uint64_t>(9 * total);
    queue()
        .submit([&](sycl::handler& h) {
          h.set_args(out, std::uint64_t{global[2]}, std::uint64_t{global[1]});
          launch(h, kernel("positions"));
        })
        .wait_and_throw();
    for (std::size_t i = 0; i < total; ++i) {
      const std::uint64_t* const item = out + 9 * i;
      const triple place = {i / (global[1] * global[2]), i / global[2] % global[1], i % global[2]};
      for (std::size_t d = 0; d < 3; ++d) {
        ASSERT_EQ(item[2 - d], place[d] + offset[d]) << "item " << i << " dimension " << d;
        ASSERT_EQ(item[3 + 2 - d], local[d]);
        ASSERT_EQ(item[6 + 2 - d], global[d]);
      }
    }
    sycl::free(out, queue());
  }
};

TEST_F(positions, of_items_in_groups_of_one_dimension) {
  check({1, 1, 12}, {1, 1, 4}, {0, 0, 0}, [](sycl::handler& h, const sycl::kernel& kernel) {
    h.parallel_for(sycl::nd_range<1>(12, 4), kernel);
  });
}
TEST_F(positions, of_items_in_groups_of_two_dimensions) {
  check({1, 6, 8}, {1, 3, 4}, {0, 0, 0}, [](sycl::handler& h, const sycl::kernel& kernel) {
    h.parallel_for(sycl::nd_range<2>({6, 8}, {3, 4}), kernel);
  });
}
TEST_F(positions, of_items_in_groups_of_three_dimensions) {
  check({4, 6, 10}, {2, 3, 5}, {0, 0, 0}, [](sycl::handler& h, const sycl::kernel& kernel) {
    h.parallel_for(sycl::nd_range<3>({4, 6, 10}, {2, 3, 5}), kernel);
  });
}
TEST_F(positions, of_items_behind_an_offset) {
  check({1, 4, 6}, {1, 2, 3}, {0, 100, 7}, [](sycl::handler& h, const sycl::kernel& kernel) {
    h.parallel_for(sycl::nd_range<2>({4, 6}, {2, 3}, {100, 7}), kernel);
  });
}

TEST_F(opencl_queue, a_plain_range_of_any_size_runs_every_item) {
  constexpr std::size_t size = 1009;  // a prime
  float* const x = shared<float>(size);
  float* const y = shared<float>(size);
  const sycl::kernel scale = kernel("scale");
  queue().submit([&](sycl::handler& h) {
    h.set_args(x, y, 2.0f);
    h.parallel_for(sycl::range<1>(size), scale);
  });
  queue().submit([&](sycl::handler& h) { h.parallel_for(sycl::range<1>(0), scale); });
  queue().wait_and_throw();
  EXPECT_EQ(std::vector<float>(y, y + size), std::vector<float>(size, 154.0f));
  sycl::free(x, queue());
  sycl::free(y, queue());
}

TEST_F(opencl_queue, threads_launch_one_kernel_with_arguments_of_their_own) {
  constexpr std::size_t size = 64;
  constexpr int threads = 4, rounds = 50;
  float* const x = shared<float>(size);
  float* const y = shared<float>(threads * rounds * size);
  const sycl::kernel scale = kernel("scale");
  std::vector<std::thread> running;
  for (int t = 0; t < threads; ++t) {
    running.emplace_back([&, t] {
      sycl::queue own(queue().get_context(), queue().get_device());
      for (int r = 0; r < rounds; ++r) {
        const int number = t * rounds + r;
        own.submit([&](sycl::handler& h) {
          h.set_args(x, y + static_cast<std::size_t>(number) * size, static_cast<float>(number));
          h.parallel_for(sycl::range<1>(size), scale);
        });
      }
      own.wait_and_throw();
    });
  }
  for (std::thread& each : running) {
    each.join();
  }
  for (std::size_t i = 0; i < threads * rounds * size; ++i) {
    ASSERT_EQ(y[i], 77.0f * static_cast<float>(i / size)) << i;
  }
  sycl::free(x, queue());
  sycl::free(y, queue());
}

TEST_F(opencl_queue, a_kernel_tells_of_itself) {
  const sycl::kernel scale = kernel("scale");
  EXPECT_EQ(scale.get_info<sycl::info::kernel::num_args>(), 3U);
  EXPECT_EQ(scale.get_info<sycl::info::kernel::function_name>(), "scale");
  std::size_t expected = 0;
  const native<cl_kernel> its(sycl::get_native<opencl>(scale), cl().clReleaseKernel);
  ASSERT_EQ(cl().clGetKernelWorkGroupInfo(its.get(), id_of(device()), CL_KERNEL_WORK_GROUP_SIZE,
                                          sizeof expected, &expected, nullptr),
            CL_SUCCESS);
  EXPECT_EQ(scale.get_info<sycl::info::kernel_device_specific::work_group_size>(device()),
            expected);
  EXPECT_GT(expected, 0U);
}

// Errors of a launch

TEST_F(opencl_queue, an_argument_that_was_never_set_is_an_asynchronous_error) {
  std::vector<std::string> texts;
  sycl::queue failing(queue().get_context(), device(), appends_to(texts));
  failing.submit([&](sycl::handler& h) { h.single_task(kernel("is_null")); });
  failing.wait_and_throw();
  EXPECT_EQ(texts, std::vector<std::string>{
                       "clEnqueueNDRangeKernel: OpenCL error -52 (CL_INVALID_KERNEL_ARGS)"});
}

TEST_F(opencl_queue, an_argument_of_the_wrong_size_or_place_is_an_asynchronous_error) {
  std::vector<std::string> texts;
  sycl::queue failing(queue().get_context(), device(), appends_to(texts));
  const sycl::kernel scale = kernel("scale");
  for (const int index : {2, 9}) {
    failing.submit([&](sycl::handler& h) {
      h.set_arg(index, 1.0);  // a double for a float, and nothing at all
      h.single_task(scale);
    });
    failing.wait_and_throw();
  }
  EXPECT_EQ(texts,
            (std::vector<std::string>{"clSetKernelArg: OpenCL error -51 (CL_INVALID_ARG_SIZE)",
                                      "clSetKernelArg: OpenCL error -49 (CL_INVALID_ARG_INDEX)"}));
}

TEST_F(opencl_queue, kernels_of_the_program_itself_are_refused) {
  EXPECT_EQ(code_of([&] { queue().single_task(nothing()); }), sycl::errc::kernel_not_supported);
}

}  // namespace
