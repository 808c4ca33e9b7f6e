// SPDX-License-Identifier: Apache-2.0
// OpenCL, bound at first use: its functions under their plain names in namespace cl.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>

#include <CL/cl.h>

#include "late_binding.hpp"

namespace kestrel::tarn::gpu {

/// Loads OpenCL and looks up its entry points, the first time that it is called; silent.
/// \returns 0, or -1 if the library or one of the names is missing; always the same
int bind_opencl();

/// Binds OpenCL and the OpenMP offload runtime. \returns 0 if both are bound, -1 if OpenCL is not,
/// -2 if OpenCL alone is
int bind_opencl_and_openmp();

enum class opencl_function : std::size_t {
#define TARN_OPENCL_FUNCTION(name) name,
#include "opencl_functions.def"
  count
};

struct opencl_runtime {
  static constexpr std::size_t size = static_cast<std::size_t>(opencl_function::count);
  static constexpr std::intptr_t unbound_result = 2;
  static constexpr auto bind = bind_opencl;
  static std::atomic<void*> functions[size];
  static binding_record record;
};

/// Pointers to functions with OpenCL's own arguments and results. A call of one that cannot be
/// bound prints its name and ends the process with status 2; if an exit hook keeps the process
/// alive, the call gives back 2, turned to its type of result.
namespace cl {

#define TARN_OPENCL_FUNCTION(name)                                                     \
  inline constexpr decltype(&::name) name =                                            \
      &bound_function<opencl_runtime, static_cast<std::size_t>(opencl_function::name), \
                      decltype(&::name)>::call;
#include "opencl_functions.def"

}  // namespace cl

}  // namespace kestrel::tarn::gpu
