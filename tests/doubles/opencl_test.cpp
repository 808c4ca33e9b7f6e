// SPDX-License-Identifier: Apache-2.0
// The OpenCL layer through the real loader: the GPU that it shows, the numbers that it keeps, and
// the failures that it makes up.
#include <cstring>
#include <iterator>
#include <vector>

#include <gtest/gtest.h>

#include "opencl_gpu_layer.hpp"
#include "opencl_loader.hpp"

namespace {

using opencl_layer::object;

const char* const source =
    "kernel void add(global int* place, int value) { place[get_global_id(0)] += value; }"
    "kernel void none() {}";

class OpenCLDouble : public testing::Test {
 protected:
  void SetUp() override {
    if (opencl_loader::find() == nullptr) {
      GTEST_SKIP() << "no OpenCL loader";
    }
    device = opencl_loader::first_gpu();
    if (device == nullptr) {
      GTEST_SKIP() << "no PoCL";
    }
    opencl_layer::reset();
    before = counts();
  }
  void TearDown() override {
    if (device != nullptr) {
      opencl_layer::reset();
      EXPECT_EQ(counts(), before);
    }
  }

  static std::vector<int> counts() {
    std::vector<int> all;
    for (int kind = 0; kind <= static_cast<int>(object::sub_device); ++kind) {
      all.push_back(opencl_layer::objects(static_cast<object>(kind)));
    }
    return all;
  }
  int living(object kind) const {
    return opencl_layer::objects(kind) - before[static_cast<std::size_t>(kind)];
  }
  cl_context make_context() const {
    cl_int code = 77;
    cl_context made = cl.clCreateContext(nullptr, 1, &device, nullptr, nullptr, &code);
    EXPECT_EQ(code, CL_SUCCESS);
    return made;
  }
  cl_program build(cl_context context) const {
    const char* text = source;
    cl_program made = cl.clCreateProgramWithSource(context, 1, &text, nullptr, nullptr);
    EXPECT_EQ(cl.clBuildProgram(made, 1, &device, "", nullptr, nullptr), CL_SUCCESS);
    return made;
  }

  const opencl_loader::functions none{};
  const opencl_loader::functions& cl =
      opencl_loader::find() == nullptr ? none : opencl_loader::get();
  cl_device_id device = nullptr;
  std::vector<int> before;
};

TEST_F(OpenCLDouble, TheCpuOfTheDriverIsAGpu) {
  cl_device_type type = 0;
  ASSERT_EQ(cl.clGetDeviceInfo(device, CL_DEVICE_TYPE, sizeof type, &type, nullptr), CL_SUCCESS);
  EXPECT_EQ(type, CL_DEVICE_TYPE_GPU);
  cl_platform_id platform = nullptr;
  ASSERT_EQ(cl.clGetDeviceInfo(device, CL_DEVICE_PLATFORM, sizeof platform, &platform, nullptr),
            CL_SUCCESS);
  cl_uint number = 77;
  EXPECT_EQ(cl.clGetDeviceIDs(platform, CL_DEVICE_TYPE_CPU, 0, nullptr, &number),
            CL_DEVICE_NOT_FOUND);
  EXPECT_EQ(cl.clGetDeviceIDs(platform, CL_DEVICE_TYPE_ALL, 0, nullptr, &number), CL_SUCCESS);
  EXPECT_GE(number, 1U);
}

TEST_F(OpenCLDouble, AContextIsMadeFromTheTypeGpu) {
  cl_int code = 77;
  EXPECT_EQ(cl.clCreateContextFromType(nullptr, CL_DEVICE_TYPE_CPU, nullptr, nullptr, &code),
            nullptr);
  EXPECT_EQ(code, CL_DEVICE_NOT_FOUND);
  cl_context context =
      cl.clCreateContextFromType(nullptr, CL_DEVICE_TYPE_GPU, nullptr, nullptr, &code);
  EXPECT_EQ(code, CL_SUCCESS);
  EXPECT_EQ(living(object::context), 1);
  EXPECT_EQ(cl.clReleaseContext(context), CL_SUCCESS);
}

TEST_F(OpenCLDouble, AnAnswerReplacesThatOfTheDriver) {
  const cl_uint query = 0x4250;
  cl_uint word = 0;
  EXPECT_EQ(cl.clGetDeviceInfo(device, query, sizeof word, &word, nullptr), CL_INVALID_VALUE);
  opencl_layer::answer(query, cl_uint{0x12345678});
  std::size_t size = 0;
  EXPECT_EQ(cl.clGetDeviceInfo(device, query, sizeof word, &word, &size), CL_SUCCESS);
  EXPECT_EQ(word, 0x12345678U);
  EXPECT_EQ(size, sizeof word);
  EXPECT_EQ(cl.clGetDeviceInfo(device, query, sizeof word - 1, &word, nullptr), CL_INVALID_VALUE);
  opencl_layer::answer_fails(query, CL_OUT_OF_RESOURCES);
  EXPECT_EQ(cl.clGetDeviceInfo(device, query, sizeof word, &word, nullptr), CL_OUT_OF_RESOURCES);
  opencl_layer::reset();
  EXPECT_EQ(cl.clGetDeviceInfo(device, query, sizeof word, &word, nullptr), CL_INVALID_VALUE);
}

TEST_F(OpenCLDouble, ReferencesOfEveryKindAreCounted) {
  cl_context context = make_context();
  EXPECT_EQ(cl.clRetainContext(context), CL_SUCCESS);
  EXPECT_EQ(living(object::context), 2);
  cl_command_queue queue = cl.clCreateCommandQueueWithProperties(context, device, nullptr, nullptr);
  EXPECT_EQ(living(object::queue), 1);
  cl_mem buffer = cl.clCreateBuffer(context, CL_MEM_READ_WRITE, 16, nullptr, nullptr);
  EXPECT_EQ(cl.clRetainMemObject(buffer), CL_SUCCESS);
  EXPECT_EQ(living(object::buffer), 2);
  void* block = cl.clSVMAlloc(context, CL_MEM_READ_WRITE, 64, 0);
  EXPECT_EQ(living(object::svm_block), 1);
  cl_program program = build(context);
  EXPECT_EQ(living(object::program), 1);
  cl_kernel kernels[2] = {};
  EXPECT_EQ(cl.clCreateKernelsInProgram(program, 2, kernels, nullptr), CL_SUCCESS);
  cl_kernel copy = cl.clCloneKernel(kernels[0], nullptr);
  EXPECT_EQ(living(object::kernel), 3);
  const int zero = 0;
  cl_event filled = nullptr;
  EXPECT_EQ(cl.clEnqueueFillBuffer(queue, buffer, &zero, 4, 0, 16, 0, nullptr, &filled),
            CL_SUCCESS);
  EXPECT_EQ(cl.clEnqueueFillBuffer(queue, buffer, &zero, 4, 0, 16, 0, nullptr, nullptr),
            CL_SUCCESS);
  cl_event of_user = cl.clCreateUserEvent(context, nullptr);
  EXPECT_EQ(living(object::event), 2);
  EXPECT_EQ(cl.clFinish(queue), CL_SUCCESS);

  for (cl_event event : {filled, of_user}) {
    EXPECT_EQ(cl.clReleaseEvent(event), CL_SUCCESS);
  }
  for (cl_kernel kernel : {kernels[0], kernels[1], copy}) {
    EXPECT_EQ(cl.clReleaseKernel(kernel), CL_SUCCESS);
  }
  EXPECT_EQ(cl.clReleaseProgram(program), CL_SUCCESS);
  cl.clSVMFree(context, block);
  EXPECT_EQ(cl.clReleaseMemObject(buffer), CL_SUCCESS);
  EXPECT_EQ(cl.clReleaseMemObject(buffer), CL_SUCCESS);
  EXPECT_EQ(cl.clReleaseCommandQueue(queue), CL_SUCCESS);
  EXPECT_EQ(cl.clReleaseContext(context), CL_SUCCESS);
  EXPECT_EQ(cl.clReleaseContext(context), CL_SUCCESS);
}

TEST_F(OpenCLDouble, SubDevicesAreCountedAndTheirParentIsNot) {
  EXPECT_EQ(cl.clRetainDevice(device), CL_SUCCESS);
  EXPECT_EQ(living(object::sub_device), 0);
  EXPECT_EQ(cl.clReleaseDevice(device), CL_SUCCESS);
  const cl_device_partition_property one_each[] = {CL_DEVICE_PARTITION_EQUALLY, 1, 0};
  cl_device_id parts[256] = {};
  cl_uint number = 0;
  ASSERT_EQ(cl.clCreateSubDevices(device, one_each, 256, parts, &number), CL_SUCCESS);
  ASSERT_GE(number, 1U);
  EXPECT_EQ(living(object::sub_device), static_cast<int>(number));
  EXPECT_EQ(cl.clRetainDevice(parts[0]), CL_SUCCESS);
  EXPECT_EQ(living(object::sub_device), static_cast<int>(number) + 1);
  EXPECT_EQ(cl.clReleaseDevice(parts[0]), CL_SUCCESS);
  for (cl_uint i = 0; i < number; ++i) {
    EXPECT_EQ(cl.clReleaseDevice(parts[i]), CL_SUCCESS);
  }
}

TEST_F(OpenCLDouble, AFailureComesOnceAfterAsManyCallsAsAsked) {
  opencl_layer::fail("clCreateContext", 1, CL_OUT_OF_HOST_MEMORY);
  const int calls = opencl_layer::calls("clCreateContext");
  cl_context first = make_context();
  cl_int code = 77;
  EXPECT_EQ(cl.clCreateContext(nullptr, 1, &device, nullptr, nullptr, &code), nullptr);
  EXPECT_EQ(code, CL_OUT_OF_HOST_MEMORY);
  EXPECT_EQ(living(object::context), 1);
  cl_context third = make_context();
  EXPECT_EQ(opencl_layer::calls("clCreateContext"), calls + 3);
  opencl_layer::fail("clReleaseContext", 0, CL_INVALID_CONTEXT);
  EXPECT_EQ(cl.clReleaseContext(third), CL_INVALID_CONTEXT);
  EXPECT_EQ(living(object::context), 2);
  for (cl_context context : {first, third}) {
    EXPECT_EQ(cl.clReleaseContext(context), CL_SUCCESS);
  }
}

TEST_F(OpenCLDouble, AFailureForGoodLastsUntilTheReset) {
  cl_context context = make_context();
  opencl_layer::fail_always("clSVMAlloc", CL_OUT_OF_RESOURCES);
  for (int i = 0; i < 3; ++i) {
    EXPECT_EQ(cl.clSVMAlloc(context, CL_MEM_READ_WRITE, 64, 0), nullptr);
  }
  opencl_layer::reset();
  void* block = cl.clSVMAlloc(context, CL_MEM_READ_WRITE, 64, 0);
  EXPECT_NE(block, nullptr);
  cl.clSVMFree(context, block);
  EXPECT_EQ(cl.clReleaseContext(context), CL_SUCCESS);
}

TEST_F(OpenCLDouble, EveryFunctionThatTheLoaderHasFailsOnDemand) {
  // With null for every argument the driver would not give this code.
  const cl_int made_up = -4242;
#define OPENCL_FUNCTION(name) opencl_layer::fail(#name, 0, made_up);
#include "opencl_functions.def"
#undef OPENCL_FUNCTION
  EXPECT_EQ(cl.clFinish(nullptr), made_up);
  EXPECT_EQ(cl.clGetKernelInfo(nullptr, 0, 0, nullptr, nullptr), made_up);
  EXPECT_EQ(cl.clEnqueueSVMMigrateMem(nullptr, 0, nullptr, nullptr, 0, 0, nullptr, nullptr),
            made_up);
  cl_int code = 0;
  EXPECT_EQ(cl.clEnqueueMapBuffer(nullptr, nullptr, 0, 0, 0, 0, 0, nullptr, nullptr, &code),
            nullptr);
  EXPECT_EQ(code, made_up);
  EXPECT_THROW(opencl_layer::fail("clNoSuchFunction", 0, made_up), std::invalid_argument);
}

TEST_F(OpenCLDouble, ACommandEndsWithTheCodeThatIsAskedFor) {
  cl_context context = make_context();
  cl_command_queue queue = cl.clCreateCommandQueueWithProperties(context, device, nullptr, nullptr);
  cl_event marker = nullptr;
  EXPECT_EQ(cl.clEnqueueMarkerWithWaitList(queue, 0, nullptr, &marker), CL_SUCCESS);
  const auto expect_end = [&](cl_int waited, cl_int wanted) {
    EXPECT_EQ(cl.clWaitForEvents(1, &marker), waited);
    cl_int status = 77;
    EXPECT_EQ(cl.clGetEventInfo(marker, CL_EVENT_COMMAND_EXECUTION_STATUS, sizeof status, &status,
                                nullptr),
              CL_SUCCESS);
    EXPECT_EQ(status, wanted);
  };
  expect_end(CL_SUCCESS, CL_COMPLETE);
  opencl_layer::fail_commands(-4242);
  expect_end(CL_EXEC_STATUS_ERROR_FOR_EVENTS_IN_WAIT_LIST, -4242);
  opencl_layer::reset();
  expect_end(CL_SUCCESS, CL_COMPLETE);
  EXPECT_EQ(cl.clReleaseEvent(marker), CL_SUCCESS);
  EXPECT_EQ(cl.clReleaseCommandQueue(queue), CL_SUCCESS);
  EXPECT_EQ(cl.clReleaseContext(context), CL_SUCCESS);
}

TEST_F(OpenCLDouble, TheClockOfTheDeviceGoesAhead) {
  cl_context context = make_context();
  const cl_queue_properties timed[] = {CL_QUEUE_PROPERTIES, CL_QUEUE_PROFILING_ENABLE, 0};
  cl_command_queue queue = cl.clCreateCommandQueueWithProperties(context, device, timed, nullptr);
  cl_event marker = nullptr;
  EXPECT_EQ(cl.clEnqueueMarkerWithWaitList(queue, 0, nullptr, &marker), CL_SUCCESS);
  EXPECT_EQ(cl.clWaitForEvents(1, &marker), CL_SUCCESS);
  const auto end = [&] {
    cl_ulong time = 77;
    EXPECT_EQ(
        cl.clGetEventProfilingInfo(marker, CL_PROFILING_COMMAND_END, sizeof time, &time, nullptr),
        CL_SUCCESS);
    return time;
  };
  const cl_ulong told = end();
  opencl_layer::shift_clock(-5000);
  EXPECT_EQ(end(), told - 5000);
  opencl_layer::reset();
  EXPECT_EQ(end(), told);
  EXPECT_EQ(cl.clReleaseEvent(marker), CL_SUCCESS);
  EXPECT_EQ(cl.clReleaseCommandQueue(queue), CL_SUCCESS);
  EXPECT_EQ(cl.clReleaseContext(context), CL_SUCCESS);
}

TEST_F(OpenCLDouble, SourceIsTakenForAnIntermediateLanguage) {
  cl_context context = make_context();
  cl_int code = 77;
  EXPECT_EQ(cl.clCreateProgramWithIL(context, source, std::strlen(source), &code), nullptr);
  EXPECT_NE(code, CL_SUCCESS);
  opencl_layer::take_source_as_il(true);
  cl_program program = cl.clCreateProgramWithIL(context, source, std::strlen(source), &code);
  EXPECT_EQ(code, CL_SUCCESS);
  EXPECT_EQ(living(object::program), 1);
  EXPECT_EQ(cl.clBuildProgram(program, 1, &device, "", nullptr, nullptr), CL_SUCCESS);
  EXPECT_EQ(cl.clReleaseProgram(program), CL_SUCCESS);
  EXPECT_EQ(cl.clReleaseContext(context), CL_SUCCESS);
}

}  // namespace
