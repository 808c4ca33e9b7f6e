// SPDX-License-Identifier: Apache-2.0
/// \file
/// Native kernels for SYCL queues. tarn_gpu_kernel.h has the same for OpenCL queues, and says what
/// a program's key is.
#pragma once

#include <cstddef>

#include <sycl/sycl.hpp>

#include "tarn_gpu_api.h"
#include "tarn_gpu_kernel.h"

namespace kestrel::tarn::gpu {

/// \name Native kernels
/// As the functions of tarn_gpu_kernel.h of nearly the same names; `kernel` of a handle is a
/// sycl::kernel*. On OpenCL devices programs are built as there. On Level Zero devices source, also
/// that of dummy programs, is compiled by the OpenCL device that stands for the same hardware, and
/// its binary goes on. The result is null on other devices.
///
/// What fails is thrown, and `*status` is left as it is: sycl::exception with errc::runtime and a
/// text that begins with "OpenCL error " and the code, "Level-Zero error:" and the code in
/// hexadecimal digits, or "error: double type is not supported on this device", and names the
/// device and the kernel. What SYCL throws passes through.
///@{

/// A kernel from OpenCL C.
TARN_GPU_API tarn_gpu_kernel_struct_t* get_OCL_kernel(int* status, sycl::queue* queue, int domain,
                                                      const char* source, const char* kernel_name,
                                                      const char* build_options);

/// The same from a program with a name of its own; the result is a sycl::kernel*, which
/// release_kernel_obj gives back.
TARN_GPU_API void* get_OCL_kernel_by_progname(int* status, sycl::queue* queue, int domain,
                                              const char* program_name, const char* source,
                                              const char* kernel_name, const char* build_options);

/// A kernel from SPIR-V.
TARN_GPU_API tarn_gpu_kernel_struct_t* tarn_gpu_get_spirv_kernel(
    int* status, sycl::queue* queue, int domain, const tarn_gpu_spirv_kernel_t* spirv,
    const char* kernel_name, const char* build_options);

/// A kernel from device code.
TARN_GPU_API tarn_gpu_kernel_struct_t* get_binary_kernel(int* status, sycl::queue* queue,
                                                         int domain,
                                                         const tarn_gpu_binary_kernel_t* binary,
                                                         const char* kernel_name);
/// The same with a key and a payload.
TARN_GPU_API tarn_gpu_kernel_struct_t* tarn_gpu_get_binary_kernel_ext(
    int* status, sycl::queue* queue, int domain, const tarn_gpu_binary_kernel_t* binary,
    const char* kernel_name, const void* key, std::size_t key_len, const void* payload,
    std::size_t payload_len);

/// A kernel of a program that is in the cache, or null.
TARN_GPU_API tarn_gpu_kernel_struct_t* tarn_gpu_get_cached_kernel(
    int* status, sycl::queue* queue, int domain, const char* kernel_name, const void* key,
    std::size_t key_len, const void** payload_out, std::size_t* payload_len_out);

/// Gives a handle back; null is ignored.
TARN_GPU_API void release_kernel(int* status, tarn_gpu_kernel_struct_t* handle);
/// Gives a kernel back; null is ignored.
TARN_GPU_API void release_kernel_obj(int* status, void* kernel);

/// 1 if device code from elsewhere is safe on the queue's device, else 0.
TARN_GPU_API int have_binary_kernels(int* status, sycl::queue* queue);
///@}

}  // namespace kestrel::tarn::gpu
