// SPDX-License-Identifier: Apache-2.0
// What the suites of the Level Zero backend share: the devices of the driver for tests, native
// objects, kernels, and the proof that everything is given back.
#pragma once

#include <chrono>
#include <cstdint>
#include <cstring>
#include <map>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "level_zero_driver.hpp"
#include "level_zero_loader.hpp"

constexpr auto level_zero = sycl::backend::ext_kestrel_level_zero;
using sycl::ext::kestrel::ownership;

// A GPU of two parts, another GPU, and an accelerator with little memory.
inline std::vector<level_zero_driver::device_description> device_descriptions() {
  level_zero_driver::device_description first;
  first.sub_devices = 2;
  level_zero_driver::device_description second;
  std::strcpy(second.name, "second");
  second.timer_nanoseconds = 80;
  level_zero_driver::device_description third;
  std::strcpy(third.name, "third");
  third.type = ZE_DEVICE_TYPE_FPGA;
  third.module_flags = ZE_DEVICE_MODULE_FLAG_FP16;
  third.memory_bytes = 1 << 20;
  third.max_group_size = 64;
  return {first, second, third};
}

// The runtime looks for devices once in a process: they are described before.
inline const std::vector<sycl::device>& level_zero_devices() {
  static const std::vector<sycl::device> found = [] {
    level_zero_driver::devices(device_descriptions());
    std::vector<sycl::device> devices;
    for (const sycl::device& each : sycl::device::get_devices()) {
      if (each.get_backend() == level_zero) {
        devices.push_back(each);
      }
    }
    return devices;
  }();
  return found;
}

// A linear congruential generator (Knuth, TAOCP volume 2, section 3.3.4, line 16 of table 1).
using number = std::uint32_t;
inline number stepped(number x, number rounds = 1) {
  for (number r = 0; r < rounds; ++r) {
    x = x * 1664525 + 1013904223;
  }
  return x;
}

// A native object, destroyed at the end of scope unless somebody took it over.
template <typename Handle>
class native {
 public:
  native(Handle object, ze_result_t(ZE_APICALL* destroy)(Handle))
      : object_(object), destroy_(destroy) {}
  native(const native&) = delete;
  native& operator=(const native&) = delete;
  ~native() {
    if (object_ != nullptr) {
      EXPECT_EQ(destroy_(object_), ZE_RESULT_SUCCESS);
    }
  }
  Handle get() const { return object_; }
  Handle give() { return std::exchange(object_, nullptr); }

 private:
  Handle object_;
  ze_result_t(ZE_APICALL* destroy_)(Handle);
};

class native_level_zero : public testing::Test {
 protected:
  void SetUp() override {
    if (level_zero_loader::find() == nullptr) {
      GTEST_SKIP() << "no Level Zero loader";
    }
    ASSERT_EQ(level_zero_devices().size(), 3U);
    level_zero_driver::reset();
    add_kernels();
    before_ = level_zero_driver::objects();
  }
  void TearDown() override {
    if (level_zero_loader::find() != nullptr) {
      level_zero_driver::reset();
      expect_given_back();
    }
  }

  void expect_given_back() const { expect_only({}); }
  // What lives besides the objects that there were before the test. A command that nobody waited
  // for is let go by a thread of the runtime, a moment after it is done.
  void expect_only(const std::map<level_zero_driver::object, int>& more) const {
    std::vector<int> expected = before_;
    for (const auto& [kind, count] : more) {
      expected[static_cast<std::size_t>(kind)] += count;
    }
    for (int round = 0; round < 2000 && level_zero_driver::objects() != expected; ++round) {
      std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
    EXPECT_EQ(level_zero_driver::objects(), expected);
  }
  static const level_zero_loader::functions& ze() { return level_zero_loader::get(); }
  static sycl::device device(std::size_t which = 0) { return level_zero_devices()[which]; }
  static ze_device_handle_t id_of(const sycl::device& device) {
    return sycl::get_native<level_zero>(device);
  }

  static native<ze_context_handle_t> new_context() {
    const ze_context_desc_t description{ZE_STRUCTURE_TYPE_CONTEXT_DESC, nullptr, 0};
    ze_context_handle_t made = nullptr;
    EXPECT_EQ(ze().zeContextCreate(sycl::get_native<level_zero>(device().get_platform()),
                                   &description, &made),
              ZE_RESULT_SUCCESS);
    return {made, ze().zeContextDestroy};
  }
  static native<ze_command_queue_handle_t> new_queue(const sycl::context& context,
                                                     const sycl::device& where = device()) {
    ze_command_queue_desc_t description{};
    description.stype = ZE_STRUCTURE_TYPE_COMMAND_QUEUE_DESC;
    description.ordinal = 1;
    ze_command_queue_handle_t made = nullptr;
    EXPECT_EQ(ze().zeCommandQueueCreate(sycl::get_native<level_zero>(context), id_of(where),
                                        &description, &made),
              ZE_RESULT_SUCCESS);
    return {made, ze().zeCommandQueueDestroy};
  }
  static native<ze_module_handle_t> new_module(const sycl::context& context,
                                               const sycl::device& where = device()) {
    const std::uint8_t bytes[] = {1, 2, 3};
    ze_module_desc_t description{};
    description.stype = ZE_STRUCTURE_TYPE_MODULE_DESC;
    description.format = ZE_MODULE_FORMAT_NATIVE;
    description.inputSize = sizeof bytes;
    description.pInputModule = bytes;
    ze_module_handle_t made = nullptr;
    EXPECT_EQ(ze().zeModuleCreate(sycl::get_native<level_zero>(context), id_of(where), &description,
                                  &made, nullptr),
              ZE_RESULT_SUCCESS);
    return {made, ze().zeModuleDestroy};
  }
  static native<ze_kernel_handle_t> new_kernel(ze_module_handle_t module, const char* name) {
    const ze_kernel_desc_t description{ZE_STRUCTURE_TYPE_KERNEL_DESC, nullptr, 0, name};
    ze_kernel_handle_t made = nullptr;
    EXPECT_EQ(ze().zeKernelCreate(module, &description, &made), ZE_RESULT_SUCCESS);
    return {made, ze().zeKernelDestroy};
  }
  // A kernel of a module with nothing else, both the SYCL kernel's.
  static sycl::kernel make_kernel(const sycl::context& context, const char* name,
                                  const sycl::device& where = device()) {
    native<ze_module_handle_t> module = new_module(context, where);
    native<ze_kernel_handle_t> kernel = new_kernel(module.get(), name);
    const auto bundle = sycl::make_kernel_bundle<level_zero, sycl::bundle_state::executable>(
        {module.give(), ownership::transfer}, context);
    return sycl::make_kernel<level_zero>({bundle, kernel.give(), ownership::transfer}, context);
  }

  // scale(x, y, a): y = a * x. step(x, rounds): as stepped. reverse(x, local): within each group.
  // sizes(out): offset, group size and group count, nine numbers.
  static void add_kernels() {
    level_zero_driver::kernel("scale", 3, [](const level_zero_driver::kernel_launch& launch) {
      for (std::size_t i = 0; i < launch.items(); ++i) {
        launch.argument<float*>(1)[i] = launch.argument<float>(2) * launch.argument<float*>(0)[i];
      }
    });
    level_zero_driver::kernel("step", 2, [](const level_zero_driver::kernel_launch& launch) {
      for (std::size_t i = 0; i < launch.items(); ++i) {
        number& x = launch.argument<number*>(0)[i];
        x = stepped(x, launch.argument<number>(1));
      }
    });
    level_zero_driver::kernel("reverse", 2, [](const level_zero_driver::kernel_launch& launch) {
      const std::size_t group = launch.group_size[0];
      if (launch.argument_bytes[1] == group * sizeof(number)) {
        number* const x = launch.argument<number*>(0);
        for (std::size_t i = 0; i < launch.items() / 2; ++i) {
          const std::size_t in = i % (group / 2), start = i / (group / 2) * group;
          std::swap(x[start + in], x[start + group - 1 - in]);
        }
      }
    });
    level_zero_driver::kernel("sizes", 1, [](const level_zero_driver::kernel_launch& launch) {
      std::copy_n(launch.offset, 3, launch.argument<number*>(0));
      std::copy_n(launch.group_size, 3, launch.argument<number*>(0) + 3);
      std::copy_n(launch.group_count, 3, launch.argument<number*>(0) + 6);
    });
  }

 private:
  std::vector<int> before_;
};

// The texts of a queue's asynchronous errors.
class remembered_errors {
 public:
  sycl::async_handler handler() {
    return [this](const sycl::exception_list& errors) {
      for (const std::exception_ptr& error : errors) {
        try {
          std::rethrow_exception(error);
        } catch (const std::exception& known) {
          texts.push_back(known.what());
        }
      }
    };
  }
  std::vector<std::string> texts;
};

// The error code of the sycl::exception that a call throws; success when it throws none.
template <typename Call>
sycl::errc code_of(const Call& call) {
  try {
    call();
  } catch (const sycl::exception& error) {
    return static_cast<sycl::errc>(error.code().value());
  }
  return sycl::errc::success;
}
