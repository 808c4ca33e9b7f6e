// SPDX-License-Identifier: Apache-2.0
// A suite over the Level Zero driver for tests, whose GPU has the OpenCL GPU for a counterpart.
#pragma once

#include <atomic>
#include <cstdint>
#include <string>
#include <vector>

#include "level_zero_binding.hpp"
#include "level_zero_driver.hpp"
#include "level_zero_loader.hpp"
#include "sycl_suite.hpp"

inline constexpr std::uint32_t spirv_words[] = {0x07230203, 0x00010000, 0, 1, 0};

/// What modules are made of, on the way to the driver.
class module_log {
 public:
  struct entry {
    ze_structure_type_t type;
    const void* next;
    ze_module_format_t format;
    std::vector<unsigned char> bytes;
    std::string flags;
    bool has_constants;
    bool has_log;
  };

  module_log() {
    kestrel::tarn::gpu::bind_level_zero();
    usual() = place().exchange(reinterpret_cast<void*>(&create));
    all().clear();
  }
  module_log(const module_log&) = delete;
  module_log& operator=(const module_log&) = delete;
  ~module_log() { place().store(usual()); }

  const std::vector<entry>& entries() const { return all(); }

 private:
  static std::atomic<void*>& place() {
    using namespace kestrel::tarn::gpu;
    return level_zero_runtime::functions[static_cast<std::size_t>(
        level_zero_function::zeModuleCreate)];
  }
  static void*& usual() {
    static void* function = nullptr;
    return function;
  }
  static std::vector<entry>& all() {
    static std::vector<entry> present;
    return present;
  }
  static ze_result_t ZE_APICALL create(ze_context_handle_t context, ze_device_handle_t device,
                                       const ze_module_desc_t* d, ze_module_handle_t* module,
                                       ze_module_build_log_handle_t* log) {
    all().push_back({d->stype, d->pNext, d->format,
                     std::vector<unsigned char>(d->pInputModule, d->pInputModule + d->inputSize),
                     d->pBuildFlags == nullptr ? "(null)" : d->pBuildFlags,
                     d->pConstants != nullptr, log != nullptr});
    return reinterpret_cast<decltype(&::zeModuleCreate)>(usual())(context, device, d, module, log);
  }
};

class LevelZeroKernels : public SyclKernels {
 protected:
  static void SetUpTestSuite() {
    if (level_zero_loader::find() != nullptr) {
      level_zero_driver::device_description gpu;
      gpu.ip_version = 9 << 22;           // Fir
      level_zero_driver::devices({gpu});  // SYCL looks for devices once
    }
  }
  std::optional<sycl::device> find_gpu() override {
    if (level_zero_loader::find() == nullptr) {
      return std::nullopt;
    }
    level_zero_driver::reset();
    level_zero_driver::kernel("k", 2, nothing);
    level_zero_driver::kernel("binary_test", 8, nothing);
    living_before = level_zero_driver::objects();
    return gpu_of(kestrel::tarn::service::backend_code::level_zero);
  }
  void SetUp() override {
    SyclKernels::SetUp();
    if (!IsSkipped()) {
      pair_devices();
      living_with_queue = level_zero_driver::objects();
    }
  }
  void TearDown() override {
    SyclKernels::TearDown();
    if (!living_before.empty()) {
      EXPECT_EQ(level_zero_driver::objects(), living_before);
    }
  }

  /// The OpenCL GPU is the same hardware.
  static void pair_devices() {
    const level_zero_driver::device_description plain;
    opencl_layer::answer(CL_DEVICE_VENDOR_ID, cl_uint{plain.vendor_id});
    opencl_layer::answer(CL_DEVICE_MAX_CLOCK_FREQUENCY, cl_uint{plain.core_clock_rate});
  }
  static void nothing(const level_zero_driver::kernel_launch&) {}

  static int modules() { return level_zero_driver::objects(level_zero_driver::object::module); }
  static int native_kernels() {
    return level_zero_driver::objects(level_zero_driver::object::kernel);
  }

  handle get_spirv(const char* options = "") {
    return kestrel::tarn::gpu::tarn_gpu_get_spirv_kernel(&status, &*queue, 2, &spirv, "k", options);
  }
  template <typename Call>
  void expect_level_zero_error(const std::string& digits, const std::string& kernel,
                               Call call) const {
    expect_error(sycl::errc::runtime,
                 "Level-Zero error:" + digits + "\nOn device: " + place(kernel), call);
  }

  const tarn_gpu_spirv_kernel_t spirv{sizeof spirv_words, spirv_words};
  std::vector<int> living_before;
  std::vector<int> living_with_queue;
};
