// SPDX-License-Identifier: Apache-2.0
// The ceiling: how fast the device memory takes stores of 16 bytes that cost nothing to compute.
// Each 32-bit word becomes its own index.
#pragma once

#include <cstddef>
#include <cuda_runtime_api.h>

namespace gpu_bench {

/// Queues a fill of `bytes` bytes (a multiple of 16, below 2^34) at `out`, aligned to 16 bytes.
using plain_fill = cudaError_t (*)(void* out, std::size_t bytes, cudaStream_t stream);

///@{
/// One store a thread; and as many threads as the device holds at a time, each with many stores.
cudaError_t fill_one_store_a_thread(void* out, std::size_t bytes, cudaStream_t stream);
cudaError_t fill_grid_stride(void* out, std::size_t bytes, cudaStream_t stream);
///@}

}  // namespace gpu_bench
