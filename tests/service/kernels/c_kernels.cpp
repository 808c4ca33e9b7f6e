// SPDX-License-Identifier: Apache-2.0
// Kernels for OpenCL queues: from source, from SPIR-V, by the name of a program, and what the cache
// makes of them.
#include <cstring>

#include "c_suite.hpp"
#include "clean_up.hpp"
#include "from_c.h"
#include "tarn_gpu.h"

namespace {

using namespace kestrel::tarn::gpu;

/// What the one item of a kernel stores.
int launched(cl_command_queue queue, cl_context context, cl_kernel kernel) {
  const opencl_loader::functions& cl = opencl_loader::get();
  int value = -77;
  cl_int code = -1;
  cl_mem buffer = cl.clCreateBuffer(context, CL_MEM_COPY_HOST_PTR, sizeof value, &value, &code);
  EXPECT_EQ(code, CL_SUCCESS);
  EXPECT_EQ(cl.clSetKernelArg(kernel, 0, sizeof buffer, static_cast<const void*>(&buffer)),
            CL_SUCCESS);
  const std::size_t one = 1;
  EXPECT_EQ(cl.clEnqueueNDRangeKernel(queue, kernel, 1, nullptr, &one, &one, 0, nullptr, nullptr),
            CL_SUCCESS);
  EXPECT_EQ(
      cl.clEnqueueReadBuffer(queue, buffer, CL_TRUE, 0, sizeof value, &value, 0, nullptr, nullptr),
      CL_SUCCESS);
  cl.clReleaseMemObject(buffer);
  return value;
}

TEST_F(CKernels, SourceIsBuiltOnceAndItsKernelComesBack) {
  const int built = builds();
  const handle kernel = get("k", 1);
  EXPECT_EQ(kernel->state, 1U);
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(kernel) % 64, 0U);
  EXPECT_EQ(arguments_of(kernel), 1);
  EXPECT_EQ(launched(queue(), context(), static_cast<cl_kernel>(kernel->kernel)), 1);
  EXPECT_EQ(programs(), 1);
  release(kernel);
  EXPECT_EQ(kernel->state, 0U);
  for (int i = 0; i < 5; ++i) {
    EXPECT_EQ(get("k", 9), kernel);  // the text is no part of the key
    EXPECT_EQ(arguments_of(kernel), 1);
    release(kernel);
  }
  EXPECT_EQ(builds(), built + 1);
  EXPECT_EQ(kernels(), 1);
}

TEST_F(CKernels, TwoHandlesOfOneKeyHaveAKernelEach) {
  const int made = kernels_made();
  const handle one = get("k", 1);
  const handle two = get("k", 1);
  EXPECT_NE(one, two);
  EXPECT_NE(one->kernel, two->kernel);
  EXPECT_EQ(kernels_made(), made + 2);
  release(one);
  release(two);
  EXPECT_EQ(get("k", 1), two);  // the latest stands first
  EXPECT_EQ(get("k", 1), one);
  EXPECT_EQ(kernels_made(), made + 2);
  EXPECT_EQ(programs(), 1);
}

TEST_F(CKernels, BuildOptionsAreTheKey) {
  const char* const source =
      "kernel void k(global int* out\n#ifdef TWO\n, int b\n#endif\n) { *out = 1; }";
  const auto get_with = [&](const char* options) {
    return tarn_serv_gpu_get_OCL_kernel(&status, queue(), 0, source, "k", options);
  };
  const handle one = get_with("-DONE");
  const handle two = get_with("-DTWO");
  ASSERT_NE(one, nullptr);
  ASSERT_NE(two, nullptr);
  EXPECT_EQ(arguments_of(one), 1);
  EXPECT_EQ(arguments_of(two), 2);
  EXPECT_EQ(programs(), 2);
  const auto* const entry = entry_of("k", "-DTWO");
  ASSERT_NE(entry, nullptr);
  EXPECT_EQ(entry->key_len, 5U);
  EXPECT_EQ(entry->payload, nullptr);
  EXPECT_EQ(entry->backend, 0);
}

TEST_F(CKernels, OptionsMayBeNull) {
  const handle kernel = get("k", 2, nullptr);
  EXPECT_EQ(arguments_of(kernel), 2);
  release(kernel);
  EXPECT_EQ(get("k", 2, ""), kernel);
}

TEST_F(CKernels, DomainsAndContextsHaveProgramsOfTheirOwn) {
  const handle one = get("k", 1, "", 1);
  const handle two = get("k", 2, "", 2);
  EXPECT_EQ(arguments_of(one), 1);
  EXPECT_EQ(arguments_of(two), 2);
  const opencl_queue other(device);
  const handle three =
      tarn_serv_gpu_get_OCL_kernel(&status, other.get(), 1, taking("k", 1).c_str(), "k", "");
  ASSERT_NE(three, nullptr);
  EXPECT_EQ(arguments_of(three), 1);
  EXPECT_EQ(programs(), 3);
  clean_up();  // the programs hold the context
}

TEST_F(CKernels, AProgramWithANameGivesPlainKernels) {
  const std::string source = taking("one", 1) + taking("two", 2);
  const int built = builds();
  const auto plain = [&](const char* name) {
    return tarn_serv_gpu_get_OCL_kernel_by_progname(&status, queue(), 1, "both", source.c_str(),
                                                    name, "");
  };
  const cl_kernel one = plain("one");
  ASSERT_NE(one, nullptr);
  const std::int64_t kept = serv_memory::live_blocks();
  const cl_kernel two = plain("two");
  ASSERT_NE(two, nullptr);
  EXPECT_EQ(serv_memory::live_blocks(), kept + 1);  // the queue's place in its ring; no handle
  EXPECT_EQ(arguments_of(one), 1);
  EXPECT_EQ(arguments_of(two), 2);
  EXPECT_EQ(builds(), built + 1);
  EXPECT_EQ(status, 0);
  tarn_serv_gpu_release_kernel_obj(&status, one);
  tarn_serv_gpu_release_kernel_obj(&status, two);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(kernels(), 0);
}

TEST_F(CKernels, APlainKernelIsNoneOfTheCaches) {
  const handle kept = get("k", 1);
  release(kept);
  const cl_kernel plain = tarn_serv_gpu_get_OCL_kernel_by_progname(&status, queue(), 0, "k",
                                                                   taking("k", 1).c_str(), "k", "");
  EXPECT_NE(plain, kept->kernel);
  EXPECT_EQ(kept->state, 0U);
  tarn_serv_gpu_release_kernel_obj(&status, plain);
}

TEST_F(CKernels, SpirVGoesToTheDriverAsItIs) {
  opencl_layer::take_source_as_il(true);
  const std::string module = taking("k", 2) + "garbage behind the end";
  const tarn_gpu_spirv_kernel_t spirv{taking("k", 2).size(), module.data()};
  const int made = opencl_layer::calls("clCreateProgramWithIL");
  const handle kernel = tarn_gpu_get_spirv_kernel(&status, queue(), 2, &spirv, "k", "-DX");
  ASSERT_NE(kernel, nullptr);
  EXPECT_EQ(arguments_of(kernel), 2);
  release(kernel);
  EXPECT_EQ(tarn_gpu_get_spirv_kernel(&status, queue(), 2, &spirv, "k", "-DX"), kernel);
  EXPECT_EQ(opencl_layer::calls("clCreateProgramWithIL"), made + 1);
  release(kernel);
  // The form is no part of the key.
  EXPECT_EQ(get("k", 1, "-DX", 2), kernel);
  EXPECT_EQ(status, 0);
}

TEST_F(CKernels, ACachedKernelOfAnUnknownKeyIsNull) {
  const void* payload = this;
  std::size_t size = 77;
  EXPECT_EQ(tarn_gpu_get_cached_kernel(&status, queue(), 0, "k", "key", 3, &payload, &size),
            nullptr);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(payload, nullptr);
  EXPECT_EQ(size, 0U);
  EXPECT_EQ(cache().bucket_count, 0U);
  get("k", 1);
  EXPECT_EQ(tarn_gpu_get_cached_kernel(&status, queue(), 0, "k", "key", 3, nullptr, nullptr),
            nullptr);
  EXPECT_EQ(status, 0);
}

TEST_F(CKernels, ACachedKernelIsTakenOrMade) {
  const handle one = get("k", 1, "-DX");
  const handle two =
      tarn_gpu_get_cached_kernel(&status, queue(), 0, "k", "-DX", 3, nullptr, nullptr);
  ASSERT_NE(two, nullptr);
  EXPECT_NE(two, one);
  EXPECT_EQ(arguments_of(two), 1);
  release(one);
  EXPECT_EQ(tarn_gpu_get_cached_kernel(&status, queue(), 0, "k", "-DX", 3, nullptr, nullptr), one);
}

TEST_F(CKernels, TheFirstFailureOfAChainIsKept) {
  status = 5;
  const handle kernel = try_get("k", 1);
  EXPECT_NE(kernel, nullptr);
  EXPECT_EQ(status, 5);
  opencl_layer::fail("clBuildProgram", 0, -11);
  EXPECT_EQ(try_get("l", 1), nullptr);
  EXPECT_EQ(status, 5);
  tarn_serv_gpu_release_kernel(&status, kernel);
  EXPECT_EQ(status, 5);
}

TEST_F(CKernels, SourceThatDoesNotCompileIsAFailedBuild) {
  EXPECT_EQ(tarn_serv_gpu_get_OCL_kernel(&status, queue(), 0, "kernel void k(", "k", ""), nullptr);
  EXPECT_EQ(status, CL_BUILD_PROGRAM_FAILURE);
  EXPECT_EQ(programs(), 0);
  EXPECT_EQ(cache().count, 0U);
}

TEST_F(CKernels, AProgramWithoutTheKernelStaysInTheCache) {
  EXPECT_EQ(tarn_serv_gpu_get_OCL_kernel(&status, queue(), 0, taking("k", 1).c_str(), "other", ""),
            nullptr);
  EXPECT_EQ(status, CL_INVALID_KERNEL_NAME);
  EXPECT_EQ(programs(), 1);
  EXPECT_EQ(cache().count, 1U);
}

TEST_F(CKernels, AQueueThatTellsNothingGivesItsStatus) {
  EXPECT_EQ(tarn_serv_gpu_get_OCL_kernel(&status, nullptr, 0, "", "k", ""), nullptr);
  EXPECT_EQ(status, CL_INVALID_COMMAND_QUEUE);
  status = 0;
  EXPECT_EQ(tarn_gpu_get_cached_kernel(&status, nullptr, 0, "k", nullptr, 0, nullptr, nullptr),
            nullptr);
  EXPECT_EQ(status, CL_INVALID_COMMAND_QUEUE);
}

TEST_F(CKernels, NothingIsBuiltForAnotherBackend) {
  tarn_serv_gpu_get_eu_count(queue());
  c_layer::tables().infos.entries[0]->backend = TARN_GPU_BACKEND_LEVEL_ZERO;
  const int built = builds();
  EXPECT_EQ(try_get("k", 1), nullptr);
  EXPECT_EQ(tarn_gpu_get_cached_kernel(&status, queue(), 0, "k", nullptr, 0, nullptr, nullptr),
            nullptr);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(builds(), built);
}

TEST_F(CKernels, NullsAreNotReleased) {
  tarn_serv_gpu_release_kernel(&status, nullptr);
  tarn_serv_gpu_release_kernel_obj(&status, nullptr);
  EXPECT_EQ(status, 0);
}

TEST_F(CKernels, APrivateHandleFreesItsKernel) {
  const cl_kernel plain = tarn_serv_gpu_get_OCL_kernel_by_progname(&status, queue(), 0, "k",
                                                                   taking("k", 1).c_str(), "k", "");
  const std::int64_t kept = serv_memory::live_blocks();
  const handle kernel = cache().make_handle(opencl_kernel(plain), TARN_GPU_KERNEL_PRIVATE);
  release(kernel);
  EXPECT_EQ(kernels(), 0);
  EXPECT_EQ(serv_memory::live_blocks(), kept);
}

TEST_F(CKernels, WhatAReleaseFailsWithIsTold) {
  const cl_kernel plain = tarn_serv_gpu_get_OCL_kernel_by_progname(&status, queue(), 0, "k",
                                                                   taking("k", 1).c_str(), "k", "");
  opencl_layer::fail("clReleaseKernel", 0, -48);
  tarn_serv_gpu_release_kernel_obj(&status, plain);
  EXPECT_EQ(status, -48);
  tarn_serv_gpu_release_kernel_obj(&status, plain);
  EXPECT_EQ(status, -48);
}

TEST_F(CKernels, TheCleanUpReleasesEverythingAndTheLayerWorksOn) {
  const handle one = get("k", 1);
  get("k", 1);
  get("l", 1);
  release(one);
  EXPECT_EQ(programs(), 2);
  EXPECT_EQ(kernels(), 3);
  clean_up();
  EXPECT_EQ(living(), before);
  EXPECT_EQ(cache().bucket_count, 0U);
  EXPECT_EQ(c_layer::tables().infos.count, 0);
  EXPECT_EQ(c_layer::tables().queues.count, 0);
  EXPECT_EQ(c_layer::tables().queues.last, -1);
  EXPECT_EQ(serv_memory::live_blocks(), blocks);
  EXPECT_EQ(arguments_of(get("k", 1)), 1);
}

TEST_F(CKernels, TheCleanUpKeepsTheFirstFailureAndGoesOn) {
  // Names of one character have one bucket, where the latest stands first.
  get("k", 1);
  const auto refused_kernel = static_cast<cl_kernel>(get("l", 1)->kernel);
  const cl_program refused_program = entry_of("k")->program.get();
  opencl_layer::fail("clReleaseKernel", 0, -48);
  opencl_layer::fail("clReleaseProgram", 1, -44);
  c_layer::clean_up(&status);
  EXPECT_EQ(status, -48);
  EXPECT_EQ(kernels(), 1);
  EXPECT_EQ(programs(), 1);
  EXPECT_EQ(serv_memory::live_blocks(), blocks);
  opencl_loader::get().clReleaseKernel(refused_kernel);
  opencl_loader::get().clReleaseProgram(refused_program);
}

TEST_F(CKernels, ACallerInC) {
  EXPECT_EQ(acquire_from_c(queue(), taking("k", 1).c_str(), "k"), 0);
  EXPECT_EQ(kernels(), 2);
}

TEST_F(CKernels, TheListOfCallbacksDoesNotKnowThisLayer) {
  const handle kernel = get("k", 1);
  tarn_sycl_destructor();
  EXPECT_EQ(cache().count, 1U);
  EXPECT_EQ(arguments_of(kernel), 1);
}

}  // namespace
