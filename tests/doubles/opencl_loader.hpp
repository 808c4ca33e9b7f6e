// SPDX-License-Identifier: Apache-2.0
// The functions of the machine's OpenCL loader, for tests that make native objects themselves.
#pragma once

#include <dlfcn.h>
#include <stdexcept>

#include <CL/cl_icd.h>

namespace opencl_loader {

struct functions {
#define OPENCL_FUNCTION(name) cl_api_##name name = nullptr;
#include "opencl_functions.def"
#undef OPENCL_FUNCTION
};

/// Null where the machine has no loader; a function that the loader lacks is null.
inline const functions* find() {
  static const functions* const found = []() -> const functions* {
    void* const library = dlopen("libOpenCL.so.1", RTLD_NOW);
    if (library == nullptr) {
      return nullptr;
    }
    auto* const all = new functions;  // lives as long as the process
#define OPENCL_FUNCTION(name) all->name = reinterpret_cast<cl_api_##name>(dlsym(library, #name));
#include "opencl_functions.def"
#undef OPENCL_FUNCTION
    return all;
  }();
  return found;
}

inline const functions& get() {
  if (find() == nullptr) {
    throw std::runtime_error("no OpenCL loader");
  }
  return *find();
}

/// The first device that a GPU query finds; null when there is no loader or no such device.
inline cl_device_id first_gpu() {
  cl_platform_id platform = nullptr;
  cl_device_id device = nullptr;
  if (find() == nullptr || get().clGetPlatformIDs(1, &platform, nullptr) != CL_SUCCESS ||
      get().clGetDeviceIDs(platform, CL_DEVICE_TYPE_GPU, 1, &device, nullptr) != CL_SUCCESS) {
    return nullptr;
  }
  return device;
}

}  // namespace opencl_loader
