// SPDX-License-Identifier: Apache-2.0
// Kernels as CUDA code: the entry points that hand an item to the user's function, and their
// launch. Every launch is one row of blocks. Only units compiled by nvcc see this header.
#pragma once

#include <cstddef>
#include <cuda_runtime.h>

#include "call_kernel.hpp"
#include "cuda_check.hpp"
#include "launch_shape.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

constexpr unsigned cuda_block = 256;     // threads of a block of a range
constexpr unsigned cuda_largest = 1024;  // items of a group, the most that a block may have
constexpr int cuda_devices_known = 16;   // whose answers are kept

template <typename Function>
__global__ void cuda_single(const __grid_constant__ Function function) {
  function();
}

// Each thread takes several items, so that what all of them have in common is computed once.
template <int Dimensions, typename Function>
__global__ void __launch_bounds__(cuda_block)
    cuda_range(const __grid_constant__ Function function,
               const __grid_constant__ range<Dimensions> sizes,
               const __grid_constant__ id<Dimensions> offset, unsigned total) {
  for (unsigned i = blockIdx.x * cuda_block + threadIdx.x; i < total; i += gridDim.x * cuda_block) {
    call_with_item(function, item_maker::with_offset<Dimensions>(
                                 index_of<Dimensions>(i, sizes) + offset, sizes, offset));
  }
}

// `launch` holds what all groups share.
template <int Dimensions, typename Function>
__global__ void __launch_bounds__(cuda_largest)
    cuda_groups(const __grid_constant__ Function function,
                const __grid_constant__ group_frame launch) {
  group_frame frame = launch;
  if constexpr (Dimensions == 1) {
    frame.group_id[0] = blockIdx.x;
  } else {
    unsigned rest = blockIdx.x;
    for (int d = Dimensions - 1; d >= 0; --d) {
      const auto groups = static_cast<unsigned>(launch.group_range[d]);
      frame.group_id[d] = rest % groups;
      rest /= groups;
    }
  }
  function(nd_item_maker::make<Dimensions>(frame, threadIdx.x));
}

// More local memory than a kernel has by default has to be asked for: all that the device has for
// it, so that launches with different needs do not take it from one another.
inline void allow_local_memory(const void* entry, const native_launch& launch) {
  if (launch.shape.local_bytes == 0) {
    return;
  }
  cudaFuncAttributes own{};
  check_cuda(cudaFuncGetAttributes(&own, entry), "cudaFuncGetAttributes");
  if (launch.shape.local_bytes > static_cast<std::size_t>(own.maxDynamicSharedSizeBytes)) {
    int most = 0;
    check_cuda(
        cudaDeviceGetAttribute(&most, cudaDevAttrMaxSharedMemoryPerBlockOptin, launch.device),
        "cudaDeviceGetAttribute");
    check_cuda(cudaFuncSetAttribute(entry, cudaFuncAttributeMaxDynamicSharedMemorySize,
                                    most - static_cast<int>(own.sharedSizeBytes)),
               "cudaFuncSetAttribute");
  }
}

template <typename... Arguments>
void launch_cuda(const native_launch& launch, void (*entry)(Arguments...), std::size_t blocks,
                 std::size_t threads, Arguments... arguments) {
  void* places[] = {&arguments...};
  const auto* code = reinterpret_cast<const void*>(entry);
  check_cuda(cudaSetDevice(launch.device), "cudaSetDevice");
  allow_local_memory(code, launch);
  check_cuda(cudaLaunchKernel(code, dim3(static_cast<unsigned>(blocks)),
                              dim3(static_cast<unsigned>(threads)), places,
                              launch.shape.local_bytes, static_cast<cudaStream_t>(launch.stream)),
             "cudaLaunchKernel");
}

// How many blocks of a range the device works on at one time.
inline unsigned cuda_blocks_at_once(const void* entry, int device) {
  int in_processor = 0;
  int processors = 0;
  check_cuda(cudaSetDevice(device), "cudaSetDevice");
  check_cuda(cudaOccupancyMaxActiveBlocksPerMultiprocessor(&in_processor, entry, cuda_block, 0),
             "cudaOccupancyMaxActiveBlocksPerMultiprocessor");
  check_cuda(cudaDeviceGetAttribute(&processors, cudaDevAttrMultiProcessorCount, device),
             "cudaDeviceGetAttribute");
  return static_cast<unsigned>(in_processor * processors);
}

template <typename Function>
void launch_cuda_single(const native_launch& launch, const Function& function) {
  launch_cuda(launch, &cuda_single<Function>, 1, 1, function);
}

template <int Dimensions, typename Function>
void launch_cuda_range(const native_launch& launch, const Function& function,
                       const range<Dimensions>& sizes, const id<Dimensions>& offset) {
  // Whole rounds of blocks, which end together; several, as processors are not equally quick.
  constexpr unsigned rounds = 4;
  static std::atomic<unsigned> at_once[cuda_devices_known];  // 0: not asked yet
  const std::size_t total = launch.shape.total();
  if (total == 0) {
    return;
  }
  const auto entry = &cuda_range<Dimensions, Function>;
  unsigned round = launch.device < cuda_devices_known ? at_once[launch.device].load() : 0;
  if (round == 0) {
    round = cuda_blocks_at_once(reinterpret_cast<const void*>(entry), launch.device);
    if (launch.device < cuda_devices_known) {
      at_once[launch.device].store(round);
    }
  }
  launch_cuda(launch, entry, std::min<std::size_t>((total - 1) / cuda_block + 1, rounds * round),
              cuda_block, function, sizes, offset, static_cast<unsigned>(total));
}

template <int Dimensions, typename Function>
void launch_cuda_groups(const native_launch& launch, const Function& function) {
  const launch_shape& shape = launch.shape;
  group_frame frame;
  frame.item_count = shape.group_size();
  for (int d = 0; d < 3; ++d) {
    frame.group_range[d] = shape.global_range[d] / shape.local_range[d];
    frame.local_range[d] = shape.local_range[d];
    frame.offset[d] = shape.offset[d];
  }
  if (shape.total() != 0) {
    launch_cuda(launch, &cuda_groups<Dimensions, Function>, shape.total() / frame.item_count,
                frame.item_count, function, frame);
  }
}

}  // namespace detail
LUMEN_NAMESPACE_END
