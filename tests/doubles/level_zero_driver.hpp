// SPDX-License-Identifier: Apache-2.0
// The controls of the Level Zero driver of the tests. The loader loads the driver by its path, from
// ZE_ENABLE_ALT_DRIVERS; a test finds the same shared object by the same path. Its devices are the
// host's memory, and its kernels functions of the test. See level_zero_driver_state.hpp for how
// commands run.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <dlfcn.h>
#include <stdexcept>
#include <string>
#include <vector>

#include <level_zero/ze_api.h>

namespace level_zero_driver {

/// A device, or all sub-devices of one.
struct device_description {
  char name[64] = "Brine Larch of the tests";
  ze_device_type_t type = ZE_DEVICE_TYPE_GPU;
  std::uint32_t vendor_id = 0xb21e;
  std::uint32_t device_id = 0x1001;
  std::uint32_t core_clock_rate = 1600;  // MHz
  std::uint32_t ip_version = 0;          // 0: the driver does not know the query
  std::uint32_t sub_devices = 0;
  std::uint32_t slices = 2;  // of 4 parts of 8 units
  std::uint32_t max_group_size = 512;
  std::uint32_t timer_nanoseconds = 52;  // a tick of its clock
  std::uint32_t kernel_timestamp_bits = 32;
  std::uint32_t module_flags = ZE_DEVICE_MODULE_FLAG_FP64 | ZE_DEVICE_MODULE_FLAG_INT64_ATOMICS;
  std::uint64_t memory_bytes = std::uint64_t{1} << 30;
};

/// A launch, as the function of its kernel gets it: once, for all groups.
struct kernel_launch {
  const void* const* arguments;       // the bytes of each; of a local one, memory of its size
  const std::size_t* argument_bytes;  // how many
  std::uint32_t argument_count;
  std::uint32_t group_size[3];
  std::uint32_t group_count[3];
  std::uint32_t offset[3];

  /// An argument by value; throws if it has another size, which ends the program.
  template <typename T>
  T argument(std::uint32_t index) const {
    if (index >= argument_count || argument_bytes[index] != sizeof(T)) {
      throw std::invalid_argument("a kernel's argument of another size");
    }
    T value;
    std::memcpy(&value, arguments[index], sizeof(T));
    return value;
  }
  std::size_t items() const {
    std::size_t count = 1;
    for (int d = 0; d < 3; ++d) {
      count *= std::size_t{group_size[d]} * group_count[d];
    }
    return count;
  }
};

/// Runs under the driver's lock: it calls neither the driver nor the controls.
using kernel_function = void (*)(const kernel_launch& launch);

/// What a program makes and has to give back.
enum class object {
  context,
  queue,
  list,
  event_pool,
  event,
  fence,
  module,
  build_log,
  kernel,
  memory,
};
constexpr int object_kinds = 10;

/// What the driver exports, as "level_zero_driver_controls".
struct controls {
  void (*devices)(const device_description* devices, std::size_t count);
  void (*kernel)(const char* name, std::uint32_t arguments, kernel_function function);
  void (*native_binary)(const std::uint8_t* bytes, std::size_t size);
  bool (*fail)(const char* function, int after, ze_result_t code, bool always);
  int (*failures_left)();
  int (*calls)(const char* function);
  const char* (*function)(std::size_t index);
  int (*objects)(object kind);
  void (*hold)();
  void (*release)();
  void (*wrap_clocks_in)(std::uint64_t nanoseconds);
  void (*reset)();
};

inline const controls& get() {
  static const auto* const found = [] {
    const char* const path = std::getenv("ZE_ENABLE_ALT_DRIVERS");
    void* const driver = path == nullptr ? nullptr : dlopen(path, RTLD_NOW);
    return static_cast<const controls*>(
        driver == nullptr ? nullptr : dlsym(driver, "level_zero_driver_controls"));
  }();
  if (found == nullptr) {
    throw std::runtime_error("ZE_ENABLE_ALT_DRIVERS names no driver for tests");
  }
  return *found;
}

inline void require(bool known, const char* function) {
  if (!known) {
    throw std::invalid_argument(std::string("the driver has no ") + function);
  }
}

/// The devices from now on; handles to those before are no longer known. One GPU at the start.
inline void devices(const std::vector<device_description>& all) {
  get().devices(all.data(), all.size());
}
/// Every module has this kernel.
inline void kernel(const char* name, std::uint32_t arguments, kernel_function function) {
  get().kernel(name, arguments, function);
}
/// What modules made from now on have as their native binary, instead of their own bytes.
inline void native_binary(const std::vector<std::uint8_t>& bytes) {
  get().native_binary(bytes.data(), bytes.size());
}

/// The call that comes after `after` others from now on fails once with `code`, and does nothing.
inline void fail(const char* function, int after, ze_result_t code) {
  require(get().fail(function, after, code, false), function);
}
/// All calls from now on fail.
inline void fail_always(const char* function, ze_result_t code) {
  require(get().fail(function, 0, code, true), function);
}
/// How many failures have been asked for and have not happened.
inline int failures_left() {
  return get().failures_left();
}

/// How often a function has been called since the start or a reset, in vain or not.
inline int calls(const char* function) {
  const int count = get().calls(function);
  require(count >= 0, function);
  return count;
}
/// The names of all functions that the driver has.
inline std::vector<std::string> functions() {
  std::vector<std::string> names;
  while (const char* const name = get().function(names.size())) {
    names.emplace_back(name);
  }
  return names;
}

/// How many objects of a kind live.
inline int objects(object kind) {
  return get().objects(kind);
}
/// The same for all kinds, in their order.
inline std::vector<int> objects() {
  std::vector<int> counts;
  for (int kind = 0; kind < object_kinds; ++kind) {
    counts.push_back(objects(static_cast<object>(kind)));
  }
  return counts;
}

/// Commands stay where they are until release.
inline void hold() {
  get().hold();
}
inline void release() {
  get().release();
}

/// The clocks of all devices jump, so that they wrap around after a time.
inline void wrap_clocks_in(std::uint64_t nanoseconds) {
  get().wrap_clocks_in(nanoseconds);
}

/// Forgets failures, numbers of calls, kernels and the native binary, and releases what is held.
/// Objects and devices stay.
inline void reset() {
  get().reset();
}

}  // namespace level_zero_driver
