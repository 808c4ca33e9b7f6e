// SPDX-License-Identifier: Apache-2.0
// The interop cache over OpenCL, which objects of every kind but 2 name: queues and contexts that
// the caller made, the references to them, and the order of commands.
#include <cstdio>
#include <cstdlib>
#include <set>
#include <vector>

#include "interop_object.hpp"
#include "opencl_gpu_layer.hpp"
#include "opencl_loader.hpp"

namespace {

using namespace tarn_test;

constexpr auto opencl = sycl::backend::opencl;
constexpr std::uintptr_t kind_opencl = 1;

int references(opencl_layer::object kind) {
  return opencl_layer::objects(kind);
}

// After the caches, since it is registered before they are constructed: they have given back their
// references.
__attribute__((constructor(101))) void watch_the_end() {
  std::atexit([] {
    if (opencl_layer::find() != nullptr && (references(opencl_layer::object::queue) != 0 ||
                                            references(opencl_layer::object::context) != 0)) {
      std::fputs("references are left at the end\n", stderr);
      std::_Exit(1);
    }
  });
}

class interop_cache_opencl : public testing::Test {
 protected:
  void SetUp() override {
    device_ = opencl_loader::first_gpu();
    if (device_ == nullptr) {
      GTEST_SKIP() << "no PoCL";
    }
    context_ = cl().clCreateContext(nullptr, 1, &device_, nullptr, nullptr, nullptr);
    ASSERT_NE(context_, nullptr);
  }
  void TearDown() override {
    if (device_ != nullptr) {
      opencl_layer::reset();
      EXPECT_EQ(cl().clReleaseContext(context_), CL_SUCCESS);
      EXPECT_EQ(omptarget::mistakes(), 0);
    }
  }

  static const opencl_loader::functions& cl() { return opencl_loader::get(); }

  cl_command_queue new_queue(bool in_order) const {
    const cl_queue_properties properties[] = {
        CL_QUEUE_PROPERTIES,
        in_order ? cl_queue_properties{0}
                 : cl_queue_properties{CL_QUEUE_OUT_OF_ORDER_EXEC_MODE_ENABLE},
        0};
    cl_command_queue made =
        cl().clCreateCommandQueueWithProperties(context_, device_, properties, nullptr);
    EXPECT_NE(made, nullptr);
    return made;
  }
  native_handles handles_of(cl_command_queue queue) const { return {device_, context_, queue}; }

  cl_device_id device_ = nullptr;
  cl_context context_ = nullptr;
};

TEST_F(interop_cache_opencl, takes_a_reference_to_queue_and_context_and_knows_the_device) {
  const int contexts = references(opencl_layer::object::context);
  cl_command_queue native = new_queue(true);
  const int queues = references(opencl_layer::object::queue);
  sycl::queue* const found = queue_of(interop_object(kind_opencl, handles_of(native)));
  ASSERT_NE(found, nullptr);
  EXPECT_EQ(references(opencl_layer::object::queue), queues + 1);
  EXPECT_EQ(references(opencl_layer::object::context), contexts + 1);

  EXPECT_EQ(found->get_backend(), opencl);
  cl_command_queue same = sycl::get_native<opencl>(*found);
  EXPECT_EQ(same, native);
  EXPECT_EQ(cl().clReleaseCommandQueue(same), CL_SUCCESS);
  cl_device_id device = sycl::get_native<opencl>(found->get_device());
  EXPECT_EQ(device, device_);
  EXPECT_EQ(cl().clReleaseDevice(device), CL_SUCCESS);

  EXPECT_EQ(cl().clReleaseCommandQueue(native), CL_SUCCESS);
  EXPECT_EQ(references(opencl_layer::object::queue), queues);
  std::vector<unsigned char> values(100, 1);
  auto* const memory = sycl::malloc_device<unsigned char>(values.size(), *found);
  ASSERT_NE(memory, nullptr);
  found->memset(memory, 42, values.size()).wait();
  found->memcpy(values.data(), memory, values.size()).wait();
  EXPECT_EQ(values, std::vector<unsigned char>(100, 42)) << "after the caller's last reference";
  sycl::free(memory, *found);
}

TEST_F(interop_cache_opencl, every_kind_but_2_is_opencl) {
  for (const std::uintptr_t kind : {0, 1, 3, 4, 6}) {
    cl_command_queue native = new_queue(true);
    sycl::queue* const found = queue_of(interop_object(kind, handles_of(native)));
    ASSERT_NE(found, nullptr);
    EXPECT_EQ(found->get_backend(), opencl);
    EXPECT_EQ(cl().clReleaseCommandQueue(native), CL_SUCCESS);
  }
}

TEST_F(interop_cache_opencl, the_queue_is_in_order_if_the_object_says_so) {
  struct {
    std::intptr_t told;
    bool in_order;
  } const cases[] = {{0, false}, {1, true}, {2, true}};
  for (const auto& row : cases) {
    cl_command_queue native = new_queue(false);
    interop_object object(kind_opencl, handles_of(native));
    object.set_int(in_order_property, row.told);
    sycl::queue* const found = queue_of(object);
    ASSERT_NE(found, nullptr);
    EXPECT_EQ(found->is_in_order(), row.in_order) << row.told;
    EXPECT_EQ(cl().clReleaseCommandQueue(native), CL_SUCCESS);
  }
  cl_command_queue native = new_queue(false);
  sycl::queue* const untold = queue_of(interop_object(kind_opencl, handles_of(native)));
  ASSERT_NE(untold, nullptr);
  EXPECT_FALSE(untold->is_in_order());
  EXPECT_EQ(cl().clReleaseCommandQueue(native), CL_SUCCESS);
}

TEST_F(interop_cache_opencl, the_queue_is_on_the_first_device_of_its_context) {
  cl_platform_id platform = nullptr;
  cl_device_id both[2] = {};
  cl_uint number = 0;
  ASSERT_EQ(cl().clGetPlatformIDs(1, &platform, nullptr), CL_SUCCESS);
  ASSERT_EQ(cl().clGetDeviceIDs(platform, CL_DEVICE_TYPE_GPU, 2, both, &number), CL_SUCCESS);
  ASSERT_EQ(number, 2u) << "POCL_DEVICES is to give two";
  cl_context context = cl().clCreateContext(nullptr, 2, both, nullptr, nullptr, nullptr);
  cl_command_queue native =
      cl().clCreateCommandQueueWithProperties(context, both[1], nullptr, nullptr);
  ASSERT_NE(native, nullptr);
  sycl::queue* const found = queue_of(interop_object(kind_opencl, {both[1], context, native}));
  ASSERT_NE(found, nullptr);
  EXPECT_EQ(found->get_context().get_devices().size(), 2u);
  cl_device_id device = sycl::get_native<opencl>(found->get_device());
  EXPECT_EQ(device, both[0]);
  EXPECT_EQ(cl().clReleaseDevice(device), CL_SUCCESS);
  EXPECT_EQ(cl().clReleaseCommandQueue(native), CL_SUCCESS);
  EXPECT_EQ(cl().clReleaseContext(context), CL_SUCCESS);
}

TEST_F(interop_cache_opencl, a_failing_driver_raises_and_leaves_nothing_behind) {
  cl_command_queue native = new_queue(true);
  const interop_object object(kind_opencl, handles_of(native));
  const int queues = references(opencl_layer::object::queue);
  const int contexts = references(opencl_layer::object::context);
  opencl_layer::fail_always("clRetainContext", CL_OUT_OF_HOST_MEMORY);
  EXPECT_THROW(queue_of(object), sycl::exception);
  opencl_layer::reset();
  EXPECT_EQ(references(opencl_layer::object::queue), queues);
  EXPECT_EQ(references(opencl_layer::object::context), contexts);

  opencl_layer::fail_always("clRetainCommandQueue", CL_OUT_OF_HOST_MEMORY);
  EXPECT_THROW(queue_of(object), sycl::exception);
  opencl_layer::reset();
  EXPECT_EQ(references(opencl_layer::object::queue), queues);
  EXPECT_EQ(references(opencl_layer::object::context), contexts + 1) << "the context is kept";

  EXPECT_NE(queue_of(object), nullptr);
  EXPECT_EQ(cl().clReleaseCommandQueue(native), CL_SUCCESS);
}

TEST_F(interop_cache_opencl, threads_that_come_together_keep_one_reference) {
  for (int round = 0; round < 10; ++round) {
    cl_command_queue native = new_queue(true);
    const int queues = references(opencl_layer::object::queue);
    const interop_object object(kind_opencl, handles_of(native));
    const std::vector<sycl::queue*> found = queues_of_threads(object, 16);
    const std::set<sycl::queue*> different(found.begin(), found.end());
    ASSERT_EQ(different.size(), 1u);
    ASSERT_NE(*different.begin(), nullptr);
    EXPECT_EQ(references(opencl_layer::object::queue), queues + 1);
    EXPECT_EQ(cl().clReleaseCommandQueue(native), CL_SUCCESS);
  }
}

}  // namespace
