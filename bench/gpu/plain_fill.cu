// SPDX-License-Identifier: Apache-2.0
// The two kernels of the ceiling, and their launches.
#include "plain_fill.hpp"

namespace gpu_bench {
namespace {

constexpr int threads = 256;

__device__ uint4 words_at(std::size_t store) {
  const auto first = static_cast<unsigned>(4 * store);
  return make_uint4(first, first + 1, first + 2, first + 3);
}

__global__ void one_store_a_thread(uint4* out, std::size_t stores) {
  const std::size_t i = static_cast<std::size_t>(blockIdx.x) * threads + threadIdx.x;
  if (i < stores)
    out[i] = words_at(i);
}

__global__ void grid_stride(uint4* out, std::size_t stores) {
  const std::size_t stride = static_cast<std::size_t>(gridDim.x) * threads;
  for (std::size_t i = static_cast<std::size_t>(blockIdx.x) * threads + threadIdx.x; i < stores;
       i += stride)
    out[i] = words_at(i);
}

// Blocks of grid_stride that the current device runs at a time.
cudaError_t resident_blocks(unsigned* blocks) {
  int device = 0, units = 0, each = 0;
  cudaError_t status = cudaGetDevice(&device);
  if (status == cudaSuccess)
    status = cudaDeviceGetAttribute(&units, cudaDevAttrMultiProcessorCount, device);
  if (status == cudaSuccess)
    status = cudaOccupancyMaxActiveBlocksPerMultiprocessor(&each, grid_stride, threads, 0);
  *blocks = static_cast<unsigned>(units * each);
  return status;
}

}  // namespace

cudaError_t fill_one_store_a_thread(void* out, std::size_t bytes, cudaStream_t stream) {
  const std::size_t stores = bytes / sizeof(uint4);
  const auto blocks = static_cast<unsigned>((stores + threads - 1) / threads);
  one_store_a_thread<<<blocks, threads, 0, stream>>>(static_cast<uint4*>(out), stores);
  return cudaGetLastError();
}

cudaError_t fill_grid_stride(void* out, std::size_t bytes, cudaStream_t stream) {
  unsigned blocks = 0;
  const cudaError_t status = resident_blocks(&blocks);
  if (status != cudaSuccess)
    return status;
  grid_stride<<<blocks, threads, 0, stream>>>(static_cast<uint4*>(out), bytes / sizeof(uint4));
  return cudaGetLastError();
}

}  // namespace gpu_bench
