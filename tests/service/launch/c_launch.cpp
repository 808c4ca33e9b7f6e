// SPDX-License-Identifier: Apache-2.0
// Launches on OpenCL queues: what kernels get, in which order they run, and what fails.
#include <thread>

#include "from_c.h"
#include "native_kernels.hpp"
#include "tarn_gpu_launch.h"

namespace {

using opencl_layer::calls;
using opencl_layer::fail;

tarn_gpu_argument_t of_buffer(cl_mem buffer) {
  tarn_gpu_argument_t arg;
  tarn_serv_gpu_set_buffer_arg(&arg, buffer, TARN_GPU_ACCESS_READ_WRITE);
  return arg;
}
template <typename T>
tarn_gpu_argument_t of_scalar(T value) {
  tarn_gpu_argument_t arg;
  tarn_serv_gpu_set_scalar_arg_internal(&arg, &value, sizeof value);
  return arg;
}

using arguments = std::vector<tarn_gpu_argument_t>;

class c_launch : public c_launches {
 protected:
  // Launches, waits and gives the event back.
  void run(cl_kernel kernel, const arguments& args, std::size_t global = 1, std::size_t local = 1) {
    finish(tarn_serv_gpu_launch_kernel_1D(&status, queue(), kernel, args.data(), global, local,
                                          nullptr));
  }
  void finish(cl_event event) {
    ASSERT_EQ(status, 0);
    ASSERT_NE(event, nullptr);
    tarn_serv_gpu_host_wait(&status, event);
    EXPECT_EQ(state_of(event), CL_COMPLETE);
    tarn_serv_gpu_release_event(&status, event);
    EXPECT_EQ(status, 0);
  }

  int status = 0;
};

TEST_F(c_launch, gives_a_kernel_its_buffer_and_scalar) {
  cl_mem place = buffer<int>({1, 2, 3, 4, 5, 6});
  run(kernel("add"), {of_buffer(place), of_scalar(10)}, 6, 3);
  EXPECT_EQ(contents<int>(place, 6), (std::vector<int>{11, 12, 13, 14, 15, 16}));
}

TEST_F(c_launch, from_c) {
  cl_mem place = buffer<int>({1, 2, 3});
  EXPECT_EQ(launch_from_c(queue(), kernel("add"), place, 100, 3), 0);
  EXPECT_EQ(contents<int>(place, 3), (std::vector<int>{201, 202, 203}));
}

TEST_F(c_launch, of_a_kernel_without_arguments_reads_none) {
  finish(
      tarn_serv_gpu_launch_kernel_1D(&status, queue(), kernel("nothing"), nullptr, 4, 2, nullptr));
}

TEST_F(c_launch, gives_scalars_of_every_size) {
  cl_mem out = buffer(std::vector<std::uint64_t>(6, 77));
  tarn_gpu_argument_t two_words = of_scalar(std::uint64_t{0xfedcba9876543210});
  two_words.size = 16;  // the words of the record behind the value are the second one
  run(kernel("scalars"), {of_buffer(out), of_scalar(std::uint8_t{0x12}),
                          of_scalar(std::uint16_t{0x3456}), of_scalar(std::uint32_t{0x789abcde}),
                          of_scalar(std::uint64_t{0x0123456789abcdef}), two_words});
  EXPECT_EQ(contents<std::uint64_t>(out, 6),
            (std::vector<std::uint64_t>{0x12, 0x3456, 0x789abcde, 0x0123456789abcdef,
                                        0xfedcba9876543210, std::uint64_t{16} << 32}));
}

TEST_F(c_launch, sets_the_three_bytes_of_a_scalar_of_three) {
  cl_mem out = buffer(std::vector<std::uint64_t>(1, 77));
  tarn_gpu_argument_t three;
  tarn_serv_gpu_set_scalar_arg_internal(&three, "\x01\x02\x03", 3);
  run(kernel("three_bytes"), {of_buffer(out), three});
  EXPECT_EQ(contents<std::uint64_t>(out, 1)[0], 0x030201u);
}

TEST_F(c_launch, ignores_kinds_and_access) {
  cl_mem place = buffer<int>({1});
  arguments args{of_buffer(place), of_scalar(10)};
  for (const std::uint32_t kind : {0u, 2u, 3u, 99u}) {
    args[0].kind = kind;
    args[0].access = static_cast<std::int32_t>(kind);
    run(kernel("add"), args);
  }
  EXPECT_EQ(contents<int>(place, 1), std::vector<int>{41});
}

TEST_F(c_launch, sets_local_memory_as_eight_bytes_of_value) {
  cl_mem out = buffer(std::vector<std::uint64_t>(1, 77));
  tarn_gpu_argument_t local;
  tarn_serv_gpu_set_SLM_arg(&local, 256);
  run(kernel("one_scalar"), {of_buffer(out), local});
  EXPECT_EQ(contents<std::uint64_t>(out, 1)[0], 256u);
  // So a parameter that is local memory gets a value, which it cannot have.
  const std::uint64_t bytes = 256;
  const cl_int refusal = cl().clSetKernelArg(kernel("reverse_groups"), 1, sizeof bytes, &bytes);
  ASSERT_NE(refusal, CL_SUCCESS);
  const arguments args{of_buffer(buffer<int>({1, 2})), local};
  EXPECT_EQ(tarn_serv_gpu_launch_kernel_1D(&status, queue(), kernel("reverse_groups"), args.data(),
                                           2, 2, nullptr),
            nullptr);
  EXPECT_EQ(status, refusal);
}

TEST_F(c_launch, has_one_two_or_three_dimensions) {
  const std::vector<std::size_t> global{12, 6, 10};
  const std::vector<std::size_t> local{4, 3, 5};
  for (std::size_t dimensions = 1; dimensions <= 3; ++dimensions) {
    const std::vector<std::size_t> sizes(global.begin(), global.begin() + dimensions);
    const std::vector<std::size_t> groups(local.begin(), local.begin() + dimensions);
    const std::vector<std::uint64_t> expected = expected_positions(sizes, groups);
    cl_mem out = buffer(std::vector<std::uint64_t>(expected.size(), 77));
    const arguments args{of_buffer(out)};
    cl_kernel positions = kernel("positions");
    if (dimensions == 1) {
      run(positions, args, sizes[0], groups[0]);
    } else {
      const auto launch =
          dimensions == 2 ? tarn_serv_gpu_launch_kernel_2D : tarn_serv_gpu_launch_kernel_3D;
      finish(
          launch(&status, queue(), positions, args.data(), sizes.data(), groups.data(), nullptr));
    }
    EXPECT_EQ(contents<std::uint64_t>(out, expected.size()), expected) << dimensions;
  }
}

// Events

TEST_F(c_launch, waits_for_the_events_of_its_list_whatever_skip_says) {
  cl_mem place = buffer<int>({1});
  const arguments args{of_buffer(place), of_scalar(10)};
  cl_kernel add = kernel("add");
  for (const std::uint32_t skip : {0u, 1u}) {
    cl_event events[] = {cl().clCreateUserEvent(context(), nullptr),
                         cl().clCreateUserEvent(context(), nullptr)};
    const tarn_gpu_event_list_t list{events, 2, skip};
    cl_event launched =
        tarn_serv_gpu_launch_kernel_1D(&status, queue(), add, args.data(), 1, 1, &list);
    ASSERT_EQ(status, 0);
    EXPECT_EQ(cl().clSetUserEventStatus(events[0], CL_COMPLETE), CL_SUCCESS);
    EXPECT_GT(state_of(launched), CL_COMPLETE);
    EXPECT_EQ(cl().clSetUserEventStatus(events[1], CL_COMPLETE), CL_SUCCESS);
    finish(launched);
    for (cl_event event : events) {  // still the caller's
      EXPECT_EQ(cl().clReleaseEvent(event), CL_SUCCESS);
    }
  }
  EXPECT_EQ(contents<int>(place, 1), std::vector<int>{21});
}

TEST_F(c_launch, takes_an_empty_list_as_none) {
  cl_mem place = buffer<int>({1});
  const arguments args{of_buffer(place), of_scalar(10)};
  cl_event never = cl().clCreateUserEvent(context(), nullptr);
  for (const std::int32_t count : {0, -1}) {
    const tarn_gpu_event_list_t list{&never, count, 0};
    finish(
        tarn_serv_gpu_launch_kernel_1D(&status, queue(), kernel("add"), args.data(), 1, 1, &list));
  }
  EXPECT_EQ(contents<int>(place, 1), std::vector<int>{21});
  EXPECT_EQ(cl().clReleaseEvent(never), CL_SUCCESS);
}

// Failures

TEST_F(c_launch, stops_at_the_first_argument_that_cannot_be_set) {
  cl_mem out = buffer(std::vector<std::uint64_t>(6, 77));
  arguments args(6, of_scalar(std::uint64_t{1}));
  args[0] = of_buffer(out);
  args[1] = of_scalar(std::uint8_t{1});  // args[2] has 8 bytes for 2
  cl_kernel scalars = kernel("scalars");
  const int set_before = calls("clSetKernelArg");
  const int launched_before = calls("clEnqueueNDRangeKernel");
  EXPECT_EQ(tarn_serv_gpu_launch_kernel_1D(&status, queue(), scalars, args.data(), 1, 1, nullptr),
            nullptr);
  EXPECT_EQ(status, CL_INVALID_ARG_SIZE);
  EXPECT_EQ(calls("clSetKernelArg") - set_before, 3);
  EXPECT_EQ(calls("clEnqueueNDRangeKernel") - launched_before, 0);
}

TEST_F(c_launch, tells_the_code_of_each_call_that_fails_and_leaves_nothing) {
  cl_mem place = buffer<int>({1});
  const arguments args{of_buffer(place), of_scalar(10)};
  cl_kernel add = kernel("add");
  const std::vector<int> living_before = living();
  struct failure {
    const char* function;
    int after;
  };
  for (const failure& each : {failure{"clGetKernelInfo", 0}, failure{"clSetKernelArg", 0},
                              failure{"clSetKernelArg", 1}, failure{"clEnqueueNDRangeKernel", 0}}) {
    status = 0;
    fail(each.function, each.after, CL_OUT_OF_RESOURCES);
    EXPECT_EQ(tarn_serv_gpu_launch_kernel_1D(&status, queue(), add, args.data(), 1, 1, nullptr),
              nullptr)
        << each.function;
    EXPECT_EQ(status, CL_OUT_OF_RESOURCES) << each.function;
    EXPECT_EQ(living(), living_before) << each.function;
  }
  status = 0;
  run(add, args);
  EXPECT_EQ(contents<int>(place, 1), std::vector<int>{11});
}

TEST_F(c_launch, works_on_after_an_earlier_failure_whose_status_survives) {
  cl_mem place = buffer<int>({1});
  const arguments args{of_buffer(place), of_scalar(10)};
  status = -1234;
  cl_event launched =
      tarn_serv_gpu_launch_kernel_1D(&status, queue(), kernel("add"), args.data(), 1, 1, nullptr);
  ASSERT_NE(launched, nullptr);
  EXPECT_EQ(status, -1234);
  fail("clWaitForEvents", 0, CL_OUT_OF_RESOURCES);
  tarn_serv_gpu_host_wait(&status, launched);
  EXPECT_EQ(status, -1234);
  EXPECT_EQ(contents<int>(place, 1), std::vector<int>{11});
  tarn_serv_gpu_release_event(&status, launched);
  EXPECT_EQ(status, -1234);
}

// Threads with kernels and queues of their own.
TEST_F(c_launch, in_threads_that_share_a_context) {
  constexpr int threads = 4;
  constexpr int rounds = 25;
  std::vector<cl_mem> places;
  std::vector<cl_kernel> adds;
  for (int t = 0; t < threads; ++t) {
    places.push_back(buffer(std::vector<int>(16, t)));
    adds.push_back(kernel("add"));
  }
  std::vector<int> statuses(threads, 77);
  std::vector<std::thread> team;
  for (std::size_t t = 0; t < threads; ++t) {
    team.emplace_back([&, t] {
      int own_status = 0;
      cl_command_queue own =
          cl().clCreateCommandQueueWithProperties(context(), device, nullptr, nullptr);
      const arguments args{of_buffer(places[t]), of_scalar(1)};
      for (int r = 0; r < rounds; ++r) {
        cl_event launched =
            tarn_serv_gpu_launch_kernel_1D(&own_status, own, adds[t], args.data(), 16, 4, nullptr);
        tarn_serv_gpu_host_wait(&own_status, launched);
        tarn_serv_gpu_release_event(&own_status, launched);
      }
      cl().clReleaseCommandQueue(own);
      statuses[t] = own_status;
    });
  }
  for (std::thread& each : team) {
    each.join();
  }
  EXPECT_EQ(statuses, std::vector<int>(threads, 0));
  for (int t = 0; t < threads; ++t) {
    EXPECT_EQ(contents<int>(places[static_cast<std::size_t>(t)], 16),
              std::vector<int>(16, t + rounds));
  }
}

}  // namespace
