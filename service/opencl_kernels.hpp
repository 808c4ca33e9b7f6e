// SPDX-License-Identifier: Apache-2.0
// Programs and kernels of OpenCL, for both layers. Calls that fail throw forge::opencl_error with
// their code.
#pragma once

#include <cstddef>
#include <utility>

#include <CL/cl.h>

#include "../forge/exceptions.hpp"
#include "bytes.hpp"

namespace kestrel::tarn::gpu {

inline void check_opencl(int code) {
  if (code != CL_SUCCESS) {
    throw forge::opencl_error(code);
  }
}

/// The forms that programs come in.
enum class program_format : char { source = 'S', spirv = 'V', binary = 'B' };

struct program_code {
  program_format format;
  const void* data;
  std::size_t size;     // bytes; source ends with NUL instead
  const char* options;  // for the compiler; may be null
};

/// A program did not build, which says more to users than another call that fails.
class build_error : public forge::opencl_error {
 public:
  build_error(int code, program_format form) : forge::opencl_error(code), format(form) {}

  program_format format;
};

cl_int release_object(cl_program program);
cl_int release_object(cl_kernel kernel);

/// Owns a reference, or nothing.
template <typename Handle>
class opencl_owner {
 public:
  opencl_owner() = default;
  explicit opencl_owner(Handle object) : object_(object) {}
  opencl_owner(opencl_owner&& other) noexcept : object_(other.release()) {}
  opencl_owner& operator=(opencl_owner&& other) noexcept {
    if (this != &other) {
      give_back();
      object_ = other.release();
    }
    return *this;
  }
  ~opencl_owner() { give_back(); }

  Handle get() const { return object_; }
  Handle release() { return std::exchange(object_, nullptr); }
  cl_int give_back() {
    const Handle object = release();
    return object == nullptr ? CL_SUCCESS : release_object(object);
  }

 private:
  Handle object_ = nullptr;
};
using opencl_program = opencl_owner<cl_program>;
using opencl_kernel = opencl_owner<cl_kernel>;

opencl_program shared_program(const opencl_program& program);

/// A program, built for the device. \throws build_error too
opencl_program build_program(cl_device_id device, cl_context context, const program_code& code);

opencl_kernel create_kernel(const opencl_program& program, const char* name);

/// What the driver has made of a program for the device.
forge::byte_vector binary_of(const opencl_program& program, cl_device_id device);

}  // namespace kestrel::tarn::gpu
