// SPDX-License-Identifier: Apache-2.0
// A shared library of the system whose functions are found by name, so that a program runs without
// it as well.
#pragma once

#include <dlfcn.h>

#include "sycl/detail/config.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// Opened once and never closed: drivers behind it keep threads of their own.
class native_library {
 public:
  explicit native_library(const char* name) noexcept
      : handle_(dlopen(name, RTLD_NOW | RTLD_LOCAL)) {}

  // False where the library or the function is missing.
  template <typename Function>
  bool find(const char* name, Function*& place) const noexcept {
    place = handle_ == nullptr ? nullptr : reinterpret_cast<Function*>(dlsym(handle_, name));
    return place != nullptr;
  }

 private:
  void* handle_;
};

}  // namespace detail
LUMEN_NAMESPACE_END
