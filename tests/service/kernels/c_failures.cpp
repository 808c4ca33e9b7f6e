// SPDX-License-Identifier: Apache-2.0
// Every native call of every road fails once, and every allocation: nothing is left behind, and the
// next try is well. And threads that want the same kernels.
#include <atomic>
#include <cstring>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "c_suite.hpp"

namespace {

using namespace kestrel::tarn::gpu;

constexpr int injected = -9999;

/// The calls of a road, in their order; `after` counts those of the same function before.
struct call {
  const char* function;
  int after;
  bool program_stays;  // it is in the cache by then
};

class CKernelFailures : public CKernels {
 protected:
  using road = std::function<void*()>;

  /// Each of the calls fails in turn. A last run without a failure shows that these are all calls.
  void expect_failures(const std::vector<call>& calls, const road& get) {
    for (const call& each : calls) {
      SCOPED_TRACE(std::string(each.function) + " after " + std::to_string(each.after));
      begin();
      opencl_layer::fail(each.function, each.after, injected);
      EXPECT_EQ(get(), nullptr);
      EXPECT_EQ(status, injected);
      opencl_layer::reset();
      EXPECT_EQ(cache().count, each.program_stays ? 1U : 0U);
      EXPECT_EQ(programs(), each.program_stays ? 1 : 0);
      clean_up();
      EXPECT_EQ(living(), before);
      EXPECT_EQ(serv_memory::live_blocks(), blocks);
    }
    begin();
    for (const call& each : calls) {
      opencl_layer::fail(each.function, times(calls, each.function), injected);
    }
    EXPECT_NE(get(), nullptr);
    EXPECT_EQ(status, 0);
  }

  /// Each allocation of the core fails in turn.
  void expect_memory_failures(const road& get) {
    int failures = 0;
    for (bool failed = true; failed; ++failures) {
      SCOPED_TRACE(failures);
      begin();
      tarn_serv_gpu_get_eu_count(queue());  // the device is known: its tables need no memory
      const std::int64_t known = serv_memory::live_blocks();
      const serv_memory::failure failure(failures);
      const void* const kernel = get();
      failed = failure.happened();
      if (failed && kernel == nullptr) {
        EXPECT_EQ(status, CL_OUT_OF_HOST_MEMORY);
      } else {
        EXPECT_EQ(status, 0);
      }
      EXPECT_EQ(kernel == nullptr && serv_memory::live_blocks() < known, false);
      clean_up();
      EXPECT_EQ(living(), before);
      EXPECT_EQ(serv_memory::live_blocks(), blocks);
    }
    EXPECT_GT(failures, 4);
  }

 private:
  void begin() {
    clean_up();
    opencl_layer::reset();
    status = 0;
  }
  static int times(const std::vector<call>& calls, const char* function) {
    int count = 0;
    for (const call& each : calls) {
      count += std::string(each.function) == function ? 1 : 0;
    }
    return count;
  }
};

TEST_F(CKernelFailures, FromSource) {
  expect_failures({{"clGetCommandQueueInfo", 0, false},
                   {"clGetCommandQueueInfo", 1, false},
                   {"clCreateProgramWithSource", 0, false},
                   {"clBuildProgram", 0, false},
                   {"clRetainProgram", 0, false},
                   {"clCreateKernel", 0, true}},
                  [&] { return try_get("k", 1); });
}

TEST_F(CKernelFailures, ByTheNameOfAProgram) {
  const auto get_and_release = [&]() -> void* {
    const cl_kernel plain = tarn_serv_gpu_get_OCL_kernel_by_progname(
        &status, queue(), 0, "p", taking("k", 1).c_str(), "k", "");
    tarn_serv_gpu_release_kernel_obj(&status, plain);
    return plain;
  };
  expect_failures({{"clCreateProgramWithSource", 0, false},
                   {"clBuildProgram", 0, false},
                   {"clRetainProgram", 0, false},
                   {"clCreateKernel", 0, true}},
                  get_and_release);
  expect_memory_failures(get_and_release);
}

TEST_F(CKernelFailures, FromSpirV) {
  const std::string module = taking("k", 1);
  const tarn_gpu_spirv_kernel_t spirv{module.size(), module.data()};
  expect_failures({{"clCreateProgramWithIL", 0, false},
                   {"clBuildProgram", 0, false},
                   {"clRetainProgram", 0, false},
                   {"clCreateKernel", 0, true}},
                  [&] {
                    opencl_layer::take_source_as_il(true);
                    return tarn_gpu_get_spirv_kernel(&status, queue(), 0, &spirv, "k", "");
                  });
}

TEST_F(CKernelFailures, FromDeviceCode) {
  const std::vector<unsigned char> code = compiled(context(), device, taking("k", 1));
  const tarn_gpu_binary_kernel_t binary{code.size(), code.data(), nullptr, nullptr};
  const auto get_binary = [&] {
    return tarn_gpu_get_binary_kernel_ext(&status, queue(), 0, &binary, "k", "key", 3, "payload",
                                          7);
  };
  expect_failures({{"clCreateProgramWithBinary", 0, false},
                   {"clBuildProgram", 0, false},
                   {"clRetainProgram", 0, false},
                   {"clCreateKernel", 0, true}},
                  get_binary);
  expect_memory_failures(get_binary);
}

TEST_F(CKernelFailures, OfACachedProgram) {
  for (const char* const function : {"clRetainProgram", "clCreateKernel"}) {
    SCOPED_TRACE(function);
    const handle taken = get("k", 1);
    const std::vector<int> kept = living();
    opencl_layer::fail(function, 0, injected);
    EXPECT_EQ(tarn_gpu_get_cached_kernel(&status, queue(), 0, "k", nullptr, 0, nullptr, nullptr),
              nullptr);
    EXPECT_EQ(status, injected);
    EXPECT_EQ(living(), kept);
    status = 0;
    release(taken);
  }
}

TEST_F(CKernelFailures, ExhaustedMemoryFromSource) {
  expect_memory_failures([&] { return try_get("k", 1, "-DX"); });
}

TEST_F(CKernelFailures, TenThreadsAcquireTheSameHundredKernels) {
  constexpr int wanted = 100;
  constexpr int acquisitions = 1000;
  constexpr int threads = 10;
  const std::vector<unsigned char> code = compiled(context(), device, taking("k", 1));
  const tarn_gpu_binary_kernel_t binary{code.size(), code.data(), nullptr, nullptr};
  std::atomic<int> failed{0};
  const auto acquire = [&](int key) {
    int code_of_thread = 0;
    const handle kernel = tarn_gpu_get_binary_kernel_ext(&code_of_thread, queue(), 0, &binary, "k",
                                                         &key, sizeof key, &key, sizeof key);
    failed += kernel == nullptr || code_of_thread != 0 ? 1 : 0;
    tarn_serv_gpu_release_kernel(&code_of_thread, kernel);
  };
  std::vector<std::thread> all;
  for (int t = 0; t < threads; ++t) {
    all.emplace_back([&acquire, t] {
      for (int i = 0; i < acquisitions; ++i) {
        acquire((t * wanted / threads + i) % wanted);
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
        tarn_gpu_get_cached_kernel(&status, queue(), 0, "k", &key, sizeof key, &payload, &size);
    ASSERT_NE(kernel, nullptr);
    ASSERT_EQ(size, sizeof key);
    ASSERT_EQ(std::memcmp(payload, &key, sizeof key), 0);
    ASSERT_EQ(arguments_of(kernel), 1);
  }
  EXPECT_EQ(builds(), built);
}

}  // namespace
