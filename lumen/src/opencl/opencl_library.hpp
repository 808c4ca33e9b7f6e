// SPDX-License-Identifier: Apache-2.0
// The machine's OpenCL loader: its functions, failures as exceptions, and references to its
// objects. Nothing is linked to it; where the loader or one of the functions is missing there is no
// OpenCL.
#pragma once

#define CL_TARGET_OPENCL_VERSION 300
#define CL_USE_DEPRECATED_OPENCL_1_2_APIS  // clCreateCommandQueue, for devices before version 2.0

#include <string>
#include <utility>

#include <CL/cl.h>

#include "sycl/detail/config.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

struct opencl_functions {
#define OPENCL_FUNCTION(name) decltype(&::name) name = nullptr;
#include "opencl_functions.def"
#undef OPENCL_FUNCTION
};

// Whether there is OpenCL; loads it when first asked.
bool has_opencl();
// To be asked for where there is.
const opencl_functions& cl();

// Throws errc::memory_allocation if memory was short, else errc::runtime. `tried` is the function
// that was called; the text has the number and the name of the code.
void check_opencl(cl_int code, const char* tried);

#define LUMEN_OPENCL_OBJECT(handle, name)                        \
  inline void retain_object(handle object) {                     \
    check_opencl(cl().clRetain##name(object), "clRetain" #name); \
  }                                                              \
  inline void release_object(handle object) noexcept {           \
    static_cast<void>(cl().clRelease##name(object));             \
  }
LUMEN_OPENCL_OBJECT(cl_device_id, Device)
LUMEN_OPENCL_OBJECT(cl_context, Context)
LUMEN_OPENCL_OBJECT(cl_command_queue, CommandQueue)
LUMEN_OPENCL_OBJECT(cl_program, Program)
LUMEN_OPENCL_OBJECT(cl_kernel, Kernel)
LUMEN_OPENCL_OBJECT(cl_event, Event)
#undef LUMEN_OPENCL_OBJECT

// A reference to an object, given back at the end.
template <typename Handle>
class opencl_reference {
 public:
  opencl_reference() = default;
  // Takes over the caller's reference.
  explicit opencl_reference(Handle object) noexcept : object_(object) {}
  opencl_reference(opencl_reference&& other) noexcept
      : object_(std::exchange(other.object_, nullptr)) {}
  opencl_reference& operator=(opencl_reference&& other) noexcept {
    std::swap(object_, other.object_);
    return *this;
  }
  ~opencl_reference() {
    if (object_ != nullptr) {
      release_object(object_);
    }
  }
  // Takes a reference of its own.
  static opencl_reference another(Handle object) {
    retain_object(object);
    return opencl_reference(object);
  }

  Handle get() const noexcept { return object_; }

 private:
  Handle object_ = nullptr;
};

}  // namespace detail
LUMEN_NAMESPACE_END
