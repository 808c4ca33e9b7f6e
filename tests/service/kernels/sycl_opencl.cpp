// SPDX-License-Identifier: Apache-2.0
// Kernels for SYCL queues over OpenCL: every road, what is kept and shared, what is thrown, and the
// clean-up.
#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <thread>
#include <vector>

#include <kestrel/tarn/gpu/launch.hpp>

#include "../../forge/binaries.hpp"
#include "binary_driver.hpp"
#include "sycl_suite.hpp"

namespace {

using namespace kestrel::tarn::gpu;
using kestrel::tarn::service::backend_code;
using opencl_layer::object;

TEST_F(SyclKernels, AKernelFromSourceRuns) {
  const handle kernel = get("k");
  int status_of_launch = 0;
  sycl::buffer<char, 1>* const buffer = calloc_temp_buffer(&status_of_launch, &*queue, 4);
  tarn_gpu_argument_t argument;
  set_buffer_arg(&argument, buffer, TARN_GPU_ACCESS_WRITE);
  sycl::event* const event =
      launch_kernel_1D(&status_of_launch, &*queue, kernel->kernel, &argument, 1, 1, nullptr);
  host_wait(&status_of_launch, event);
  release_event(&status_of_launch, event);
  EXPECT_EQ((sycl::host_accessor<char, 1, sycl::access_mode::read>(*buffer)[0]), 1);
  free_buffer(&status_of_launch, buffer);
}

TEST_F(SyclKernels, SourceIsBuiltOnceAndItsKernelComesBack) {
  const int built = builds();
  const handle kernel = get("k");
  EXPECT_EQ(kernel->state, 1U);
  EXPECT_EQ(arguments_of(kernel), 1);
  EXPECT_EQ(programs(), 1);
  EXPECT_EQ(kernels(), 1);
  const handle second = get("k", 9);
  EXPECT_NE(second, kernel);
  EXPECT_EQ(kernels(), 2);
  release(kernel);
  release(second);
  EXPECT_EQ(kernel->state, 0U);
  EXPECT_EQ(get("k"), second);
  EXPECT_EQ(get("k"), kernel);
  EXPECT_EQ(builds(), built + 1);
}

TEST_F(SyclKernels, TheKernelIsOneOfTheQueuesContext) {
  const auto* const kernel = static_cast<const sycl::kernel*>(get("k")->kernel);
  EXPECT_EQ(kernel->get_context(), queue->get_context());
  EXPECT_EQ(kernel->get_info<sycl::info::kernel::function_name>(), "k");
}

TEST_F(SyclKernels, AnEntryKeepsABundleAndTheSyclContext) {
  get("k");
  const auto* const entry =
      cache()
          .fetch({device, {native_context(), queue->get_context()}, TARN_GPU_BACKEND_OPENCL},
                 {0, "k", {}}, false)
          .where;
  ASSERT_NE(entry, nullptr);
  EXPECT_TRUE(std::holds_alternative<kestrel::tarn::service::kernel_bundle>(entry->program));
  ASSERT_TRUE(entry->context.owner.has_value());
  EXPECT_EQ(*entry->context.owner, queue->get_context());
  EXPECT_EQ(entry->backend, 0);
}

TEST_F(SyclKernels, AContextLivesUntilTheCleanUp) {
  const int contexts = opencl_layer::objects(object::context);
  {
    sycl::queue other = queue_on(queue->get_device());
    get_OCL_kernel(&status, &other, 0, taking("k", 1).c_str(), "k", "");
    EXPECT_EQ(programs(), 1);
  }
  EXPECT_GT(opencl_layer::objects(object::context), contexts);
  tarn_sycl_destructor();
  EXPECT_EQ(opencl_layer::objects(object::context), contexts);
}

TEST_F(SyclKernels, QueuesOfOneNativeContextShareAProgram) {
  const handle first = get("k");
  release(first);
  sycl::queue second(queue->get_context(), queue->get_device());
  EXPECT_EQ(get_OCL_kernel(&status, &second, 0, "", "k", ""), first);
  release(first);
  // The key is the native context: another SYCL context over it makes no difference.
  const cl_context native = sycl::get_native<sycl::backend::opencl>(queue->get_context());
  sycl::queue third(sycl::make_context<sycl::backend::opencl>(native), queue->get_device());
  opencl_loader::get().clReleaseContext(native);
  EXPECT_EQ(get_OCL_kernel(&status, &third, 0, "", "k", ""), first);
  sycl::queue fourth = queue_on(queue->get_device());
  EXPECT_NE(get_OCL_kernel(&status, &fourth, 0, taking("k", 2).c_str(), "k", ""), first);
  EXPECT_EQ(programs(), 2);
  tarn_sycl_destructor();
}

TEST_F(SyclKernels, AProgramWithANameGivesPlainKernels) {
  const std::string source = taking("one", 1) + taking("two", 2);
  const int built = builds();
  const auto plain = [&](const char* name) {
    return static_cast<sycl::kernel*>(
        get_OCL_kernel_by_progname(&status, &*queue, 1, "both", source.c_str(), name, ""));
  };
  sycl::kernel* const one = plain("one");
  const std::int64_t kept = serv_memory::live_blocks();
  sycl::kernel* const two = plain("two");
  EXPECT_EQ(serv_memory::live_blocks(), kept);  // no handle is left
  EXPECT_EQ(one->get_info<sycl::info::kernel::num_args>(), 1U);
  EXPECT_EQ(two->get_info<sycl::info::kernel::num_args>(), 2U);
  EXPECT_EQ(builds(), built + 1);
  release_kernel_obj(&status, one);
  release_kernel_obj(&status, two);
  EXPECT_EQ(kernels(), 0);
}

TEST_F(SyclKernels, SpirVGoesToTheDriver) {
  opencl_layer::take_source_as_il(true);
  const std::string module = taking("k", 2);
  const tarn_gpu_spirv_kernel_t spirv{module.size(), module.data()};
  const int made = opencl_layer::calls("clCreateProgramWithIL");
  const handle kernel = tarn_gpu_get_spirv_kernel(&status, &*queue, 2, &spirv, "k", "-DX");
  EXPECT_EQ(arguments_of(kernel), 2);
  release(kernel);
  EXPECT_EQ(tarn_gpu_get_spirv_kernel(&status, &*queue, 2, &spirv, "k", "-DX"), kernel);
  EXPECT_EQ(opencl_layer::calls("clCreateProgramWithIL"), made + 1);
}

TEST_F(SyclKernels, DeviceCodeWithAKeyAndAPayload) {
  const std::vector<unsigned char> program = compiled(native_context(), device, taking("k", 2));
  const tarn_gpu_binary_kernel_t binary{program.size(), program.data(), nullptr, nullptr};
  const handle kernel =
      tarn_gpu_get_binary_kernel_ext(&status, &*queue, 3, &binary, "k", "key", 3, "payload", 7);
  EXPECT_EQ(arguments_of(kernel), 2);
  release(kernel);
  const void* payload = nullptr;
  std::size_t size = 0;
  EXPECT_EQ(tarn_gpu_get_cached_kernel(&status, &*queue, 3, "k", "key", 3, &payload, &size),
            kernel);
  EXPECT_EQ(std::string(static_cast<const char*>(payload), size), "payload");
  EXPECT_EQ(tarn_gpu_get_cached_kernel(&status, &*queue, 3, "k", "kez", 3, &payload, &size),
            nullptr);
  EXPECT_EQ(payload, nullptr);
  EXPECT_EQ(size, 0U);
  EXPECT_EQ(arguments_of(get_binary_kernel(&status, &*queue, 3, &binary, "k")), 2);
  EXPECT_EQ(programs(), 2);
}

TEST_F(SyclKernels, DeviceCodeWithADummySource) {
  const binary_driver driver(tarn_test::older_binary({}), taking("k", 2));
  const std::vector<unsigned char> code = tarn_test::counting(500, 3);
  const tarn_gpu_binary_kernel_t binary{code.size(), code.data(), "kernel void k() {}", "-DDUMMY"};
  const auto get_it = [&] {
    return tarn_gpu_get_binary_kernel_ext(&status, &*queue, 3, &binary, "k", "key", 3, "lost", 4);
  };
  const handle kernel = get_it();
  EXPECT_EQ(arguments_of(kernel), 2);
  EXPECT_EQ(driver.options(), (std::vector<std::string>{"-DDUMMY", ""}));
  ASSERT_EQ(driver.taken().size(), 1U);
  EXPECT_NE(
      std::search(driver.taken()[0].begin(), driver.taken()[0].end(), code.begin(), code.end()),
      driver.taken()[0].end());
  EXPECT_EQ(programs(), 1);
  EXPECT_EQ(cache().count, 1U);
  release(kernel);
  EXPECT_EQ(get_it(), kernel);
  const void* payload = this;
  EXPECT_NE(tarn_gpu_get_cached_kernel(&status, &*queue, 3, "k", "key", 3, &payload, nullptr),
            nullptr);
  EXPECT_EQ(payload, nullptr);
}

TEST_F(SyclKernels, ACodeThatCannotBePutInThrowsTheSplicesCode) {
  const binary_driver driver({}, taking("k", 2));
  const tarn_gpu_binary_kernel_t binary{1, "c", "kernel void k() {}", ""};
  expect_opencl_error(-2001, "k", [&] { get_binary_kernel(&status, &*queue, 3, &binary, "k"); });
  EXPECT_EQ(programs(), 0);
}

TEST_F(SyclKernels, NothingIsBuiltForOtherBackends) {
  sycl::queue virtual_queue(gpu_of(backend_code::host).value());
  const int built = builds();
  EXPECT_EQ(get_OCL_kernel(&status, &virtual_queue, 0, "", "k", ""), nullptr);
  EXPECT_EQ(get_OCL_kernel_by_progname(&status, &virtual_queue, 0, "p", "", "k", ""), nullptr);
  EXPECT_EQ(
      tarn_gpu_get_cached_kernel(&status, &virtual_queue, 0, "k", nullptr, 0, nullptr, nullptr),
      nullptr);
  EXPECT_EQ(builds(), built);
}

TEST_F(SyclKernels, NullsAreNotReleased) {
  release_kernel(&status, nullptr);
  release_kernel_obj(&status, nullptr);
}

TEST_F(SyclKernels, APrivateHandleFreesItsKernel) {
  auto* const plain = static_cast<sycl::kernel*>(
      get_OCL_kernel_by_progname(&status, &*queue, 0, "k", taking("k", 1).c_str(), "k", ""));
  const std::int64_t kept = serv_memory::live_blocks();
  release(cache().make_handle(layer::kernel(plain), TARN_GPU_KERNEL_PRIVATE));
  EXPECT_EQ(kernels(), 0);
  EXPECT_EQ(serv_memory::live_blocks(), kept);
}

TEST_F(SyclKernels, NativeFailuresAreThrownWithTheDeviceAndTheKernel) {
  struct row {
    const char* function;
    int after;
    int domain;
    std::string kernel;
  };
  const std::vector<row> rows = {
      {"clCreateProgramWithSource", 0, 0, "k"},
      {"clBuildProgram", 0, 1, "kestrel::tarn::blas::k"},
      {"clCreateKernel", 0, 2, "kestrel::tarn::dft::k"},
      {"clCreateKernel", 0, 5, "kestrel::tarn::lapack::k"},
  };
  for (const row& each : rows) {
    SCOPED_TRACE(each.function);
    opencl_layer::fail(each.function, each.after, -9999);
    expect_opencl_error(-9999, each.kernel, [&] { get("k", 1, "", each.domain); });
    opencl_layer::reset();
    tarn_sycl_destructor();
    EXPECT_EQ(living(), with_queue);
  }
}

TEST_F(SyclKernels, WhatSyclThrowsPassesThrough) {
  for (const auto& [function, after] :
       {std::pair{"clRetainProgram", 0}, {"clRetainProgram", 1}, {"clRetainKernel", 0}}) {
    SCOPED_TRACE(std::string(function) + std::to_string(after));
    opencl_layer::fail(function, after, -9999);
    try {
      get("k");
      ADD_FAILURE() << "nothing thrown";
    } catch (const sycl::exception& error) {
      EXPECT_NE(std::string(error.what()).find(function), std::string::npos) << error.what();
    }
    opencl_layer::reset();
    tarn_sycl_destructor();
    EXPECT_EQ(living(), with_queue);
  }
}

TEST_F(SyclKernels, ExhaustedMemoryIsAnErrorOfOpenCL) {
  int failures = 0;
  get_eu_count(&*queue);
  for (bool failed = true; failed; ++failures) {
    SCOPED_TRACE(failures);
    const std::int64_t known = serv_memory::live_blocks();
    {
      const serv_memory::failure failure(failures);
      try {
        get("dk", 1, "-DX", 1);
      } catch (const sycl::exception& error) {
        EXPECT_EQ(error.what(), "OpenCL error -6\nOn device: " + place("kestrel::tarn::blas::dk"));
        EXPECT_TRUE(failure.happened());
      }
      failed = failure.happened();
    }
    int ignored = 0;
    cache().clear(&ignored);
    EXPECT_EQ(programs(), 0);
    EXPECT_LE(serv_memory::live_blocks(), known + 1);  // the list of callbacks
  }
  EXPECT_GT(failures, 5);
}

TEST_F(SyclKernels, ADoubleKernelOnADeviceWithDoublePrecisionIsAnOrdinaryFailure) {
  ASSERT_FALSE(queue->get_device().get_info<sycl::info::device::double_fp_config>().empty());
  opencl_layer::fail("clBuildProgram", 0, -11);
  expect_opencl_error(-11, "kestrel::tarn::blas::dk", [&] { get("dk", 1, "", 1); });
}

TEST_F(SyclKernels, TheFirstInsertAsksForTheCleanUpWhichMayHaveNoMemory) {
  get_eu_count(&*queue);
  // The first allocation is the bucket array, the second the list of callbacks.
  {
    const serv_memory::failure failure(1);
    expect_opencl_error(-6, "k", [&] { get("k"); });
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_EQ(cache().bucket_count, 0U);
  EXPECT_EQ(programs(), 0);
  get("k");
  EXPECT_EQ(cache().bucket_count, 1021U);
  tarn_sycl_destructor();
  EXPECT_EQ(living(), with_queue);
}

TEST_F(SyclKernels, TheCleanUpEmptiesAllTablesAndANewQueueWorks) {
  for (int round = 0; round < 3; ++round) {
    sycl::queue fresh = queue_on(queue->get_device());
    const handle kernel = get_OCL_kernel(&status, &fresh, 0, taking("k", 1).c_str(), "k", "");
    get_OCL_kernel(&status, &fresh, 0, "", "k", "");
    EXPECT_EQ(arguments_of(kernel), 1);
    EXPECT_GT(sycl_tables().infos.count, 0);
    EXPECT_GT(sycl_tables().queues.count, 0);
    tarn_sycl_destructor();
    EXPECT_EQ(cache().bucket_count, 0U);
    EXPECT_EQ(cache().buckets, nullptr);
    EXPECT_EQ(sycl_tables().infos.count, 0);
    EXPECT_EQ(sycl_tables().queues.count, 0);
    EXPECT_EQ(sycl_tables().queues.last, -1);
    EXPECT_EQ(programs(), 0);
    EXPECT_EQ(kernels(), 0);
    EXPECT_EQ(serv_memory::live_blocks(), blocks);
  }
}

void tell_what_is_left() {
  std::fprintf(stderr, "programs left: %d, kernels left: %d\n",
               opencl_layer::objects(object::program), opencl_layer::objects(object::kernel));
}

TEST_F(SyclKernels, TheEndOfTheProcessCleansUp) {
  testing::FLAGS_gtest_death_test_style = "threadsafe";
  EXPECT_EXIT(
      {
        std::atexit(tell_what_is_left);  // called after what is registered later
        get("k");
        std::exit(programs() == 1 && kernels() == 1 ? 0 : 1);
      },
      testing::ExitedWithCode(0), "programs left: 0, kernels left: 0");
}

TEST_F(SyclKernels, TenThreadsAcquireTheSameHundredKernels) {
  constexpr int wanted = 100;
  constexpr int acquisitions = 1000;
  constexpr int threads = 10;
  const std::vector<unsigned char> code = compiled(native_context(), device, taking("k", 1));
  const tarn_gpu_binary_kernel_t binary{code.size(), code.data(), nullptr, nullptr};
  std::atomic<int> failed{0};
  std::vector<std::thread> all;
  for (int t = 0; t < threads; ++t) {
    all.emplace_back([&, t] {
      for (int i = 0; i < acquisitions; ++i) {
        const int key = (t * wanted / threads + i) % wanted;
        int unused = 0;
        const handle kernel = tarn_gpu_get_binary_kernel_ext(&unused, &*queue, 0, &binary, "k",
                                                             &key, sizeof key, &key, sizeof key);
        failed += kernel == nullptr ? 1 : 0;
        release_kernel(&unused, kernel);
      }
    });
  }
  for (std::thread& thread : all) {
    thread.join();
  }
  EXPECT_EQ(failed, 0);
  EXPECT_EQ(cache().count, static_cast<std::uint64_t>(wanted));
  EXPECT_EQ(programs(), wanted);
  const int built = builds();
  for (int key = 0; key < wanted; ++key) {
    const void* payload = nullptr;
    std::size_t size = 0;
    const handle kernel =
        tarn_gpu_get_cached_kernel(&status, &*queue, 0, "k", &key, sizeof key, &payload, &size);
    ASSERT_NE(kernel, nullptr);
    ASSERT_EQ(size, sizeof key);
    ASSERT_EQ(std::memcmp(payload, &key, sizeof key), 0);
  }
  EXPECT_EQ(builds(), built);
  tarn_sycl_destructor();
  EXPECT_EQ(living(), with_queue);
}

}  // namespace
