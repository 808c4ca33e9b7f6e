// SPDX-License-Identifier: Apache-2.0
/// \file
/// Native kernels on SYCL queues: their arguments, launches, device memory and events, in one
/// family for memory in buffers and one, with names that end in _usm, for unified shared memory.
/// tarn_gpu_launch.h has the records, and the same for OpenCL queues.
#pragma once

#include <cstddef>

#include <sycl/sycl.hpp>

#include "tarn_gpu_launch.h"

namespace kestrel::tarn::gpu {

/// \name Arguments
/// Each fills a whole record, and never fails.
///@{

/// A buffer and what the kernel does to it.
TARN_GPU_API void set_buffer_arg(tarn_gpu_argument_t* arg, sycl::buffer<char, 1>* buffer,
                                 tarn_gpu_access_t access);
/// A pointer into unified shared memory.
TARN_GPU_API void tarn_gpu_set_usm_arg(tarn_gpu_argument_t* arg, const void* pointer);
/// The same; `access` is ignored.
TARN_GPU_API void set_buffer_arg_usm(tarn_gpu_argument_t* arg, const void* pointer,
                                     tarn_gpu_access_t access);
/// So many bytes of memory that a work-group shares.
TARN_GPU_API void set_SLM_arg(tarn_gpu_argument_t* arg, std::size_t bytes);
/// `size` bytes at `value`, at most 8 of them.
TARN_GPU_API void set_scalar_arg_internal(tarn_gpu_argument_t* arg, const void* value,
                                          std::size_t size);
///@}

/// \name Launches
/// Submits `kernel`, a sycl::kernel* of the queue's context, after the events of a list that may be
/// null. The event of the launch is the caller's, to be given to release_event; verbose reports
/// know of it as well. `*status` is left as it is in all functions of this file.
///
/// The kernel's arguments are taken from `args`. One that has another kind or access than the
/// records know, or is a scalar of other than 1, 2, 4, 8 or 16 bytes, is left as an earlier launch
/// has set it, and so is a buffer in the functions for unified shared memory. Those also ignore
/// tarn_gpu_event_list_t::skip.
///
/// `global` and `local` are one, two or three sizes; the first is that of the dimension whose
/// numbers vary fastest among the items of a group, get_global_id(0) in OpenCL C.
///
/// \throws sycl::exception as the submission does
///@{
/// Over one size each, on memory in buffers.
TARN_GPU_API sycl::event* launch_kernel_1D(int* status, sycl::queue* queue, void* kernel,
                                           const tarn_gpu_argument_t* args, std::size_t global,
                                           std::size_t local, const tarn_gpu_event_list_t* events);
/// Over two sizes each, on memory in buffers.
TARN_GPU_API sycl::event* launch_kernel_2D(int* status, sycl::queue* queue, void* kernel,
                                           const tarn_gpu_argument_t* args,
                                           const std::size_t* global, const std::size_t* local,
                                           const tarn_gpu_event_list_t* events);
/// Over three sizes each, on memory in buffers.
TARN_GPU_API sycl::event* launch_kernel_3D(int* status, sycl::queue* queue, void* kernel,
                                           const tarn_gpu_argument_t* args,
                                           const std::size_t* global, const std::size_t* local,
                                           const tarn_gpu_event_list_t* events);
/// Over one size each, on unified shared memory.
TARN_GPU_API sycl::event* launch_kernel_1D_usm(int* status, sycl::queue* queue, void* kernel,
                                               const tarn_gpu_argument_t* args, std::size_t global,
                                               std::size_t local,
                                               const tarn_gpu_event_list_t* events);
/// Over two sizes each, on unified shared memory.
TARN_GPU_API sycl::event* launch_kernel_2D_usm(int* status, sycl::queue* queue, void* kernel,
                                               const tarn_gpu_argument_t* args,
                                               const std::size_t* global, const std::size_t* local,
                                               const tarn_gpu_event_list_t* events);
/// Over three sizes each, on unified shared memory.
TARN_GPU_API sycl::event* launch_kernel_3D_usm(int* status, sycl::queue* queue, void* kernel,
                                               const tarn_gpu_argument_t* args,
                                               const std::size_t* global, const std::size_t* local,
                                               const tarn_gpu_event_list_t* events);
///@}

/// \name Memory in buffers
/// `size` in bytes. A buffer is the caller's until it is freed.
///@{

/// A buffer of unknown contents.
TARN_GPU_API sycl::buffer<char, 1>* alloc_temp_buffer(int* status, sycl::queue* queue,
                                                      std::size_t size);
/// A buffer of zeros, which are there on return. \throws sycl::exception as filling it does
TARN_GPU_API sycl::buffer<char, 1>* calloc_temp_buffer(int* status, sycl::queue* queue,
                                                       std::size_t size);
/// Destroys a buffer, after waiting for its users; null is ignored. Nothing is thrown: what fails
/// is told on standard error, as "exception in ~buffer".
TARN_GPU_API void free_buffer(int* status, sycl::buffer<char, 1>* buffer);
///@}

/// \name Unified shared memory
/// `size` in bytes, on the queue's device. It is the caller's until it is freed.
///@{

/// Memory of unknown contents; null if there is not enough.
TARN_GPU_API void* alloc_temp_buffer_usm(int* status, sycl::queue* queue, std::size_t size);
/// Zeros, which are there on return; null if there is not enough memory. \throws sycl::exception as
/// filling it does
TARN_GPU_API void* calloc_temp_buffer_usm(int* status, sycl::queue* queue, std::size_t size);
/// Gives memory back, without waiting for those who use it; null is ignored.
TARN_GPU_API void free_buffer_usm(int* status, void* pointer, sycl::queue* queue);
///@}

/// \name Events
/// Two names each, for the two families.
///@{

/// One event that is complete when all of the list are, which are released; later commands of the
/// queue come after it. A completed event for a list without events, or, in the first function, one
/// to be skipped. \throws sycl::exception as the submission does; the events are then gone as well
TARN_GPU_API sycl::event* coalesce_events(int* status, sycl::queue* queue,
                                          const tarn_gpu_event_list_t* events);
TARN_GPU_API sycl::event* coalesce_events_usm(int* status, sycl::queue* queue,
                                              const tarn_gpu_event_list_t* events);

/// Gives an event back; null is ignored.
TARN_GPU_API void release_event(int* status, sycl::event* event);
TARN_GPU_API void release_event_usm(int* status, sycl::event* event);

/// Waits for an event.
TARN_GPU_API void host_wait(int* status, sycl::event* event);
TARN_GPU_API void host_wait_usm(int* status, sycl::event* event);
///@}

}  // namespace kestrel::tarn::gpu
