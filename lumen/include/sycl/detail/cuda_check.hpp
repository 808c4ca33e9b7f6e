// SPDX-License-Identifier: Apache-2.0
// Failures of the CUDA runtime as exceptions with its own text.
#pragma once

#include <cuda_runtime_api.h>

#include "launch_shape.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// `tried` is the function that was called. What can be forgotten is told once.
inline void check_cuda(cudaError_t result, const char* tried) {
  if (result != cudaSuccess) {
    static_cast<void>(cudaGetLastError());
    throw_native(tried, cudaGetErrorString(result), result == cudaErrorMemoryAllocation);
  }
}

}  // namespace detail
LUMEN_NAMESPACE_END
