// SPDX-License-Identifier: Apache-2.0
// The functions of the machine's Level Zero loader, for tests that make native objects themselves.
#pragma once

#include <dlfcn.h>
#include <stdexcept>

#include <level_zero/ze_api.h>

namespace level_zero_loader {

struct functions {
#define LEVEL_ZERO_FUNCTION(table, entry, name) decltype(&::name) name = nullptr;
#include "level_zero_driver_functions.def"
#undef LEVEL_ZERO_FUNCTION
};

/// Null where the machine has no loader. The functions are those that the driver for tests has.
inline const functions* find() {
  static const functions* const found = []() -> const functions* {
    void* const library = dlopen("libze_loader.so.1", RTLD_NOW);
    if (library == nullptr) {
      return nullptr;
    }
    auto* const all = new functions;  // lives as long as the process
#define LEVEL_ZERO_FUNCTION(table, entry, name) \
  all->name = reinterpret_cast<decltype(&::name)>(dlsym(library, #name));
#include "level_zero_driver_functions.def"
#undef LEVEL_ZERO_FUNCTION
    return all;
  }();
  return found;
}

inline const functions& get() {
  if (find() == nullptr) {
    throw std::runtime_error("no Level Zero loader");
  }
  return *find();
}

/// The driver and its first device, after zeInit.
struct first_device {
  ze_driver_handle_t driver = nullptr;
  ze_device_handle_t device = nullptr;

  first_device() {
    std::uint32_t one = 1;
    require(get().zeInit(0), "zeInit");
    require(get().zeDriverGet(&one, &driver), "zeDriverGet");
    one = 1;
    require(get().zeDeviceGet(driver, &one, &device), "zeDeviceGet");
  }

 private:
  static void require(ze_result_t result, const char* what) {
    if (result != ZE_RESULT_SUCCESS) {
      throw std::runtime_error(what);
    }
  }
};

}  // namespace level_zero_loader
