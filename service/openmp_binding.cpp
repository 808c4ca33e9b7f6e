// SPDX-License-Identifier: Apache-2.0
// The table of the OpenMP offload runtime.
#include "openmp_binding.hpp"

namespace kestrel::tarn::gpu {
namespace {

constexpr const char* names[] = {
#define TARN_OPENMP_FUNCTION(name) #name,
#include "openmp_functions.def"
};

}  // namespace

std::atomic<void*> openmp_runtime::functions[] = {};
binding_record openmp_runtime::record{"libomptarget.so", names, functions, size};

int bind_openmp() {
  return bind_under_lock(openmp_runtime::record);
}

}  // namespace kestrel::tarn::gpu
