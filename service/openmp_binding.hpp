// SPDX-License-Identifier: Apache-2.0
// The OpenMP offload runtime, bound at first use: what interop objects are asked through.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>

#include "late_binding.hpp"

namespace kestrel::tarn::gpu {

/// Loads the OpenMP offload runtime and looks up its entry points, the first time that it is
/// called; silent. \returns 0, or -1 if the library or one of the names is missing; always the same
int bind_openmp();

enum class openmp_function : std::size_t {
#define TARN_OPENMP_FUNCTION(name) name,
#include "openmp_functions.def"
  count
};

struct openmp_runtime {
  static constexpr std::size_t size = static_cast<std::size_t>(openmp_function::count);
  static constexpr std::intptr_t unbound_result = 2;
  static constexpr auto bind = bind_openmp;
  static std::atomic<void*> functions[size];
  static binding_record record;
};

/// The types of the functions below, since not every compiler brings a header for them. The names
/// that begin with omp_ are those of OpenMP 5.1, section 3.12.
struct openmp_types {
  using __tgt_get_interop_property = int (*)(void* interop, int property, void** value);
  using omp_get_interop_int = std::intptr_t (*)(const void* interop, int property, int* status);
  using omp_get_interop_ptr = void* (*)(const void* interop, int property, int* status);
  using omp_get_interop_str = const char* (*)(const void* interop, int property, int* status);
};

/// Pointers to the functions. A call of one that cannot be bound prints its name and ends the
/// process with status 2; if an exit hook keeps the process alive, the call gives back 2, turned to
/// its type of result.
namespace omp_interop {

#define TARN_OPENMP_FUNCTION(name)                                                     \
  inline constexpr openmp_types::name name =                                           \
      &bound_function<openmp_runtime, static_cast<std::size_t>(openmp_function::name), \
                      openmp_types::name>::call;
#include "openmp_functions.def"

}  // namespace omp_interop

}  // namespace kestrel::tarn::gpu
