// SPDX-License-Identifier: Apache-2.0
/// \file
/// Which native device stands behind a SYCL queue, and what it can do. tarn_gpu.h has the same for
/// OpenCL queues.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "tarn_gpu.h"

namespace kestrel::tarn::gpu {

/// \name Identification of devices
/// As the functions of tarn_gpu.h of nearly the same names, for queues of every backend. What fails
/// is thrown, and `*status` is left as it is: sycl::exception with errc::runtime and the text
/// "OpenCL error " followed by the code, -6 when memory is exhausted. A device that is neither
/// OpenCL's nor Level Zero's has a null handle, one tile, counts of 0 and an unknown architecture.
///@{

/// The native handle of the queue's device: cl_device_id or ze_device_handle_t, without a reference
/// added, or null.
TARN_GPU_API void* get_device_id(int* status, sycl::queue* queue);

/// Copies what is known of the device to `*info`, without deciding the architecture. \returns 0
TARN_GPU_API int get_device_info(sycl::queue* queue, tarn_gpu_device_info_t* info);
/// The same once the architecture has been decided. \returns 0
TARN_GPU_API int get_device_info_with_arch(sycl::queue* queue, tarn_gpu_device_info_t* info);

/// The architecture; unknown, and not found out anew, if what finds it out fails.
TARN_GPU_API tarn_gpu_arch_t get_architecture(int* status, sycl::queue* queue);
/// The same with the stepping; either pointer may be null.
TARN_GPU_API void get_architecture_and_stepping(int* status, sycl::queue* queue,
                                                tarn_gpu_arch_t* arch, std::uint32_t* stepping);
/// The flags of tarn_gpu_device_info_t, the architecture decided.
TARN_GPU_API std::uint32_t get_device_flags(int* status, sycl::queue* queue);

/// Parts that can be used as devices of their own; >= 1.
TARN_GPU_API int get_tile_count(sycl::queue* queue);
/// Compute units.
TARN_GPU_API int get_eu_count(sycl::queue* queue);
/// Work-items in one work-group.
TARN_GPU_API int tarn_gpu_get_max_workgroup_size(sycl::queue* queue);

/// The OpenCL device and context of the queue; either pointer may be null. For a Level Zero queue:
/// the first OpenCL device with the same vendor and clock rate, and a context of its own that the
/// library keeps; "OpenCL error -1" is thrown if there is none. Null for other backends. No
/// reference is added.
TARN_GPU_API void tarn_gpu_get_cl_device_context(int* status, sycl::queue* queue,
                                                 _cl_device_id** device, _cl_context** context);
///@}

}  // namespace kestrel::tarn::gpu
