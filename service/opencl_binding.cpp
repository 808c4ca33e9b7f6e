// SPDX-License-Identifier: Apache-2.0
// The table of OpenCL.
#include "opencl_binding.hpp"

#include "openmp_binding.hpp"

namespace kestrel::tarn::gpu {
namespace {

constexpr const char* names[] = {
#define TARN_OPENCL_FUNCTION(name) #name,
#include "opencl_functions.def"
};

}  // namespace

std::atomic<void*> opencl_runtime::functions[] = {};
binding_record opencl_runtime::record{"libOpenCL.so.1", names, functions, size};

int bind_opencl() {
  return bind_under_lock(opencl_runtime::record);
}

int bind_opencl_and_openmp() {
  if (bind_opencl() != 0) {
    return -1;
  }
  return bind_openmp() != 0 ? -2 : 0;
}

}  // namespace kestrel::tarn::gpu
