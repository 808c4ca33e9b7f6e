// SPDX-License-Identifier: Apache-2.0
// The controls of a double of the OpenMP offload runtime. No runtime at hand makes interop objects
// without its compiler and a device; those of the double say what a test tells them. It is
// libomptarget.so in a folder of its own, found by that name when LD_LIBRARY_PATH has the folder.
#pragma once

#include <cstdint>
#include <dlfcn.h>
#include <memory>
#include <stdexcept>
#include <string>

namespace omptarget {

/// What the double exports, as "omptarget_controls".
struct controls {
  void* (*make)();
  void (*end)(void* interop);
  void (*set_native)(void* interop, int property, int status, void* value);
  void (*set_int)(void* interop, int property, std::intptr_t value);
  void (*set_ptr)(void* interop, int property, void* value);
  void (*set_str)(void* interop, int property, const char* value);
  void (*fail_int)(void* interop, int property, int status, std::intptr_t value);
  bool (*calls)(const char* function, int* number);
  int (*mistakes)();
};

inline const controls& get() {
  static const auto* const found = [] {
    void* const library = dlopen("libomptarget.so", RTLD_NOW);
    return static_cast<const controls*>(library == nullptr ? nullptr
                                                           : dlsym(library, "omptarget_controls"));
  }();
  if (found == nullptr) {
    throw std::runtime_error("LD_LIBRARY_PATH does not lead to the double of libomptarget.so");
  }
  return *found;
}

/// How often a function of the runtime has been called, in vain or not.
inline int calls(const char* function) {
  int number = 0;
  if (!get().calls(function, &number)) {
    throw std::invalid_argument(std::string("the runtime has no ") + function);
  }
  return number;
}

/// How often one has been called with an interop object that was not there, or no longer.
inline int mistakes() {
  return get().mistakes();
}

/// An interop object. A property that is not set is missing.
class interop {
 public:
  interop() : handle_(get().make()) {}
  ~interop() { get().end(handle_); }
  interop(const interop&) = delete;
  interop& operator=(const interop&) = delete;

  /// What the functions of the runtime take, omp_interop_t.
  void* handle() const { return handle_; }

  /// What __tgt_get_interop_property stores, with the result 0.
  void set_native(int property, void* value) { get().set_native(handle_, property, 0, value); }
  /// It stores nothing, and its result is `status`.
  void fail_native(int property, int status) {
    get().set_native(handle_, property, status, nullptr);
  }
  /// It stores `value`, and its result is `status` nevertheless.
  void fail_native_with(int property, int status, void* value) {
    get().set_native(handle_, property, status, value);
  }
  /// Property 2, a pointer to a byte.
  void set_nowait(bool nowait) {
    *nowait_ = nowait ? 1 : 0;
    set_native(2, nowait_.get());
  }
  /// Property 4, a function to be called with the handle when a call that was not waited for is
  /// done.
  void set_completion(void (*function)(void* interop)) {
    set_native(4, reinterpret_cast<void*>(function));
  }

  /// What the functions omp_get_interop_int, _ptr and _str give; a property has one of these types.
  void set_int(int property, std::intptr_t value) { get().set_int(handle_, property, value); }
  void set_ptr(int property, void* value) { get().set_ptr(handle_, property, value); }
  void set_str(int property, const char* value) { get().set_str(handle_, property, value); }
  /// omp_get_interop_int gives `value`, and tells `status`, which is not 0.
  void fail_int_with(int property, int status, std::intptr_t value) {
    get().fail_int(handle_, property, status, value);
  }

 private:
  void* handle_;
  std::unique_ptr<unsigned char> nowait_ = std::make_unique<unsigned char>();
};

}  // namespace omptarget
