// SPDX-License-Identifier: Apache-2.0
// Every call of OpenCL fails once at every occurrence in a day's work that makes all of them. Each
// failure is told, by the SYCL call itself or to the queue's handler, and nothing that was made
// before it is left over.
#include <algorithm>
#include <map>

#include "native_opencl.hpp"

namespace {

const char* const source = "kernel void set(global int* a, int x) { a[get_global_id(0)] = x; }";

constexpr std::size_t size = 100;

class opencl_failures : public native_opencl {
 protected:
  void SetUp() override {
    native_opencl::SetUp();
    if (!IsSkipped()) {
      given_ = std::make_unique<natives>();
    }
  }
  void TearDown() override {
    given_.reset();
    native_opencl::TearDown();
  }

  // All that is not lumen's own call.
  struct natives {
    native<cl_context> context = new_context({id_of(device())});
    native<cl_command_queue> queue =
        new_queue(context.get(), id_of(device()), CL_QUEUE_OUT_OF_ORDER_EXEC_MODE_ENABLE);
    native<cl_program> program = new_program(context.get(), source);
    native<cl_kernel> kernel = new_kernel(program.get(), "set");
  };
  static cl_device_id new_sub_device() {
    const auto units = static_cast<cl_device_partition_property>(
        device().get_info<sycl::info::device::max_compute_units>());
    const cl_device_partition_property all[] = {CL_DEVICE_PARTITION_EQUALLY, units, 0};
    cl_device_id made = nullptr;
    EXPECT_EQ(cl().clCreateSubDevices(id_of(device()), all, 1, &made, nullptr), CL_SUCCESS);
    return made;
  }

  // Whether the work told of a failure.
  bool work_fails(cl_device_id sub_device) {
    std::vector<std::string> texts;
    try {
      static_cast<void>(sycl::make_device<opencl>(sub_device));
      work(texts);
    } catch (const sycl::exception& error) {
      texts.push_back(error.what());
    }
    return !texts.empty();
  }

  void work(std::vector<std::string>& texts) {
    const sycl::context own(device());
    using sycl::property::queue::enable_profiling;
    sycl::queue timed(own, device(), appends_to(texts), enable_profiling());
    const sycl::context context = sycl::make_context<opencl>(given_->context.get());
    sycl::queue queue = sycl::make_queue<opencl>(given_->queue.get(), context, appends_to(texts));
    sycl::queue other(context, device(), appends_to(texts));
    const sycl::kernel kernel = sycl::make_kernel<opencl>(given_->kernel.get(), context);
    const auto bundle = sycl::make_kernel_bundle<opencl, sycl::bundle_state::executable>(
        given_->program.get(), context);
    ask(context, queue, kernel, bundle);
    int* const place = sycl::aligned_alloc_shared<int>(4096, size, queue);
    if (place == nullptr) {
      throw sycl::exception(sycl::make_error_code(sycl::errc::memory_allocation), "no memory");
    }
    try {
      use_memory(place, queue, other, kernel);
      use_buffer(other, timed, kernel);
    } catch (const sycl::exception& error) {
      texts.push_back(error.what());
    }
    for (sycl::queue each : {queue, other, timed}) {
      each.wait_and_throw();
    }
    sycl::free(place, context);
  }

  static void ask(const sycl::context& context, const sycl::queue& queue,
                  const sycl::kernel& kernel,
                  const sycl::kernel_bundle<sycl::bundle_state::executable>& bundle) {
    static_cast<void>(kernel.get_info<sycl::info::kernel::num_args>());
    static_cast<void>(kernel.get_info<sycl::info::kernel::function_name>());
    static_cast<void>(
        kernel.get_info<sycl::info::kernel_device_specific::work_group_size>(device()));
    EXPECT_EQ(cl().clReleaseDevice(sycl::get_native<opencl>(device())), CL_SUCCESS);
    EXPECT_EQ(cl().clReleaseContext(sycl::get_native<opencl>(context)), CL_SUCCESS);
    EXPECT_EQ(cl().clReleaseCommandQueue(sycl::get_native<opencl>(queue)), CL_SUCCESS);
    EXPECT_EQ(cl().clReleaseKernel(sycl::get_native<opencl>(kernel)), CL_SUCCESS);
    EXPECT_EQ(cl().clReleaseProgram(sycl::get_native<opencl>(bundle)[0]), CL_SUCCESS);
  }

  static void use_memory(int* place, sycl::queue& queue, sycl::queue& other,
                         const sycl::kernel& kernel) {
    const sycl::event set = queue.submit([&](sycl::handler& h) {
      h.set_args(place, 5);
      h.parallel_for(sycl::range<1>(size), kernel);
    });
    for (const cl_event each : sycl::get_native<opencl>(set)) {
      EXPECT_EQ(cl().clReleaseEvent(each), CL_SUCCESS);
    }
    std::vector<int> values(size, 77);
    sycl::event last = other.copy(place, values.data(), size, set);
    last = queue.fill(place, 7, size, last);
    last = queue.prefetch(place, size * sizeof(int), last);
    queue.wait();
    other.wait();
  }

  // The last command's time is asked for when it is done.
  static void use_buffer(sycl::queue& queue, sycl::queue& timed, const sycl::kernel& kernel) {
    sycl::buffer<int> buffer{sycl::range<1>(size)};
    queue.submit([&](sycl::handler& h) {
      h.set_args(sycl::accessor<int, 1, sycl::access_mode::write>(buffer, h), 9);
      h.parallel_for(sycl::range<1>(size), kernel);
    });
    { const sycl::host_accessor host(buffer); }
    timed.submit([&](sycl::handler& h) {
      h.fill(sycl::accessor<int, 1, sycl::access_mode::read_write>(buffer, h), 3);
    });
  }

  std::unique_ptr<natives> given_;
};

TEST_F(opencl_failures, are_told_and_leave_nothing_over) {
  // Not called once the devices are known, or for older devices only; questions that a device need
  // not answer; what gives back (a reference whose release fails is lost, whoever lets it go);
  // clFinish, which ends what another failure began; clGetEventInfo, whose failure leads to the
  // wait that comes anyway; and that wait, which cannot end before the command does.
  const std::vector<std::string> left_out = {
      "clGetPlatformIDs", "clGetPlatformInfo", "clGetDeviceIDs",        "clCreateCommandQueue",
      "clGetDeviceInfo",  "clReleaseDevice",   "clReleaseContext",      "clReleaseEvent",
      "clReleaseProgram", "clReleaseKernel",   "clReleaseCommandQueue", "clSVMFree",
      "clFinish",         "clGetEventInfo",    "clWaitForEvents"};
  const char* const names[] = {
#define OPENCL_FUNCTION(name) #name,
#include "../src/opencl/opencl_functions.def"
#undef OPENCL_FUNCTION
  };
  for (const char* const name : names) {
    if (std::find(left_out.begin(), left_out.end(), name) != left_out.end()) {
      continue;
    }
    int failures = 0;
    for (int after = 0;; ++after) {
      const cl_device_id sub_device = new_sub_device();
      const std::vector<int> before = counts();
      const int calls = opencl_layer::calls(name);
      opencl_layer::fail(name, after, CL_OUT_OF_RESOURCES);
      const bool told = work_fails(sub_device);
      const bool failed = opencl_layer::calls(name) > calls + after;
      opencl_layer::reset();
      EXPECT_EQ(cl().clReleaseDevice(sub_device), CL_SUCCESS);
      ASSERT_EQ(counts(), before) << name << ", call " << after;
      ASSERT_EQ(told, failed) << name << ", call " << after;
      if (!failed) {
        break;
      }
      ++failures;
    }
    EXPECT_GT(failures, 0) << name;
  }
}

TEST_F(opencl_failures, of_the_commands_themselves_are_told_and_leave_nothing_over) {
  const std::vector<int> before = counts();
  opencl_layer::fail_commands(CL_OUT_OF_RESOURCES);
  EXPECT_TRUE(work_fails(id_of(device())));
  EXPECT_EQ(counts(), before);
}

TEST_F(opencl_failures, of_memory_have_their_own_code) {
  for (const cl_int code : {CL_OUT_OF_HOST_MEMORY, CL_MEM_OBJECT_ALLOCATION_FAILURE}) {
    opencl_layer::fail("clCreateContext", 0, code);
    EXPECT_EQ(code_of([] { sycl::context{device()}; }), sycl::errc::memory_allocation);
  }
  opencl_layer::fail("clCreateContext", 0, CL_OUT_OF_RESOURCES);
  EXPECT_EQ(code_of([] { sycl::context{device()}; }), sycl::errc::runtime);
}

TEST_F(opencl_failures, of_an_unknown_code_say_its_number) {
  opencl_layer::fail("clCreateContext", 0, -9999);
  try {
    const sycl::context context(device());
    ADD_FAILURE();
  } catch (const sycl::exception& error) {
    EXPECT_STREQ(error.what(), "clCreateContext: OpenCL error -9999 (unknown)");
  }
}

TEST_F(opencl_failures, to_ask_how_far_a_command_is_lead_to_a_wait) {
  opencl_layer::fail_always("clGetEventInfo", CL_OUT_OF_RESOURCES);
  EXPECT_FALSE(work_fails(id_of(device())));
}

}  // namespace
