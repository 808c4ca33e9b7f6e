/* SPDX-License-Identifier: Apache-2.0 */
/** \file
 * Native kernels on OpenCL queues: their arguments, launches, device memory and events. Usable from
 * C and C++; kestrel/tarn/gpu/launch.hpp has the same for SYCL queues, with buffers and with
 * unified shared memory, on the same records.
 *
 * Functions with a `status` store what fails in `*status`, an OpenCL code, but only while that is
 * 0, so that the first failure of a chain of calls survives. They do their work whatever it is.
 * All functions may be called from any thread; a kernel has its arguments from one launch at a
 * time. */
#ifndef TARN_GPU_LAUNCH_H
#define TARN_GPU_LAUNCH_H

#include <stddef.h>
#include <stdint.h>

#include "tarn_gpu_api.h"

#ifdef __cplusplus
extern "C" {
#endif

/** \cond */
struct _cl_command_queue;
struct _cl_event;
struct _cl_kernel;
struct _cl_mem;
/** \endcond */

/** What a kernel does to a buffer. */
typedef enum tarn_gpu_access_t {
  TARN_GPU_ACCESS_READ = 0,      /**< reads */
  TARN_GPU_ACCESS_WRITE = 1,     /**< writes */
  TARN_GPU_ACCESS_READ_WRITE = 2 /**< both */
} tarn_gpu_access_t;

/** What an argument is. */
typedef enum tarn_gpu_argument_kind_t {
  TARN_GPU_ARGUMENT_SCALAR = 0,  /**< bytes */
  TARN_GPU_ARGUMENT_BUFFER = 1,  /**< a buffer */
  TARN_GPU_ARGUMENT_POINTER = 2, /**< a pointer into unified shared memory */
  TARN_GPU_ARGUMENT_LOCAL = 3    /**< memory that a work-group shares */
} tarn_gpu_argument_kind_t;

#pragma pack(push, 1)
/** One argument of a kernel; 20 bytes without padding. A launch takes an array of them in the order
 * of the kernel's arguments. */
typedef struct tarn_gpu_argument_t {
  unsigned char value[8]; /**< bytes of a scalar; a cl_mem, sycl::buffer<char, 1>* or pointer; or,
                               as 64 bits, how many bytes of local memory */
  uint32_t kind;          /**< tarn_gpu_argument_kind_t */
  uint32_t size;          /**< bytes of a scalar, and 8 for all else. The 16 bytes of a scalar of
                               that size are the first of the record, `kind` and `size` among them */
  int32_t access;         /**< tarn_gpu_access_t for a buffer, 2 for all else */
} tarn_gpu_argument_t;
#pragma pack(pop)

/** Events that a command waits for, or that become one. A list that is null or has none is one
 * without events. */
typedef struct tarn_gpu_event_list_t {
  const void* events; /**< array of cl_event or of sycl::event* */
  int32_t count;      /**< how many; less than 1 for none */
  uint32_t skip; /**< non-zero: launches and merges on SYCL buffers take the list as if it had no
                      events; all others ignore this */
} tarn_gpu_event_list_t;

/** \cond */
#ifdef __cplusplus
#define TARN_GPU_LAYOUT(condition) static_assert(condition, "callers fill these records")
#else
#define TARN_GPU_LAYOUT(condition) _Static_assert(condition, "callers fill these records")
#endif
TARN_GPU_LAYOUT(sizeof(tarn_gpu_argument_t) == 20);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_argument_t, value) == 0);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_argument_t, kind) == 8);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_argument_t, size) == 12);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_argument_t, access) == 16);
TARN_GPU_LAYOUT(sizeof(tarn_gpu_access_t) == 4);
TARN_GPU_LAYOUT(sizeof(tarn_gpu_event_list_t) == 16);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_event_list_t, events) == 0);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_event_list_t, count) == 8);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_event_list_t, skip) == 12);
#undef TARN_GPU_LAYOUT
/** \endcond */

/** \name Arguments
 * Each fills a whole record, and never fails. */
/**@{*/
/** A buffer. OpenCL does not need to know its access. */
TARN_GPU_API void tarn_serv_gpu_set_buffer_arg(tarn_gpu_argument_t* arg, struct _cl_mem* buffer,
                                               tarn_gpu_access_t access);
/** A pointer into unified shared memory. */
TARN_GPU_API void tarn_gpu_set_usm_arg(tarn_gpu_argument_t* arg, const void* pointer);
/** So many bytes of local memory; for launches on SYCL queues only. */
TARN_GPU_API void tarn_serv_gpu_set_SLM_arg(tarn_gpu_argument_t* arg, size_t bytes);
/** `size` bytes at `value`; 8 of them if it is greater than 8 or negative. */
TARN_GPU_API void tarn_serv_gpu_set_scalar_arg_internal(tarn_gpu_argument_t* arg, const void* value,
                                                        int size);
/**@}*/

/** \name Launches
 * Sets all arguments of `kernel` and enqueues it, after the events of a list that may be null. The
 * event of the launch is the caller's; null on failure, when arguments may have been set.
 *
 * Each argument is set as the `size` bytes at the start of its record, whatever its kind. So a
 * pointer into unified shared memory has to be one that the driver takes as a plain value, and
 * local memory cannot be asked for. `args` may be null for a kernel that takes none. */
/**@{*/
/** Over `global` work-items in groups of `local`. */
TARN_GPU_API struct _cl_event* tarn_serv_gpu_launch_kernel_1D(int* status,
                                                              struct _cl_command_queue* queue,
                                                              struct _cl_kernel* kernel,
                                                              const tarn_gpu_argument_t* args,
                                                              size_t global, size_t local,
                                                              const tarn_gpu_event_list_t* events);
/** Over two sizes each; the first is that of get_global_id(0). */
TARN_GPU_API struct _cl_event* tarn_serv_gpu_launch_kernel_2D(
    int* status, struct _cl_command_queue* queue, struct _cl_kernel* kernel,
    const tarn_gpu_argument_t* args, const size_t* global, const size_t* local,
    const tarn_gpu_event_list_t* events);
/** Over three sizes each. */
TARN_GPU_API struct _cl_event* tarn_serv_gpu_launch_kernel_3D(
    int* status, struct _cl_command_queue* queue, struct _cl_kernel* kernel,
    const tarn_gpu_argument_t* args, const size_t* global, const size_t* local,
    const tarn_gpu_event_list_t* events);
/**@}*/

/** \name Memory
 * Buffers of `size` bytes that kernels may read and write, in the context of the queue. They are
 * the caller's until they are freed. */
/**@{*/
/** A buffer of unknown contents; null on failure. */
TARN_GPU_API struct _cl_mem* tarn_serv_gpu_alloc_temp_buffer(int* status,
                                                             struct _cl_command_queue* queue,
                                                             size_t size);
/** A buffer of zeros; null on failure. Waits for what the queue has to do. */
TARN_GPU_API struct _cl_mem* tarn_serv_gpu_calloc_temp_buffer(int* status,
                                                              struct _cl_command_queue* queue,
                                                              size_t size);
/** Gives a buffer back; a null one is a failure, CL_INVALID_MEM_OBJECT. */
TARN_GPU_API void tarn_serv_gpu_free_buffer(int* status, struct _cl_mem* buffer);
/**@}*/

/** \name Events */
/**@{*/
/** One event for all of the list, which are released in their order, or, for a list without events,
 * for all that the queue has been given. Null on failure: the event whose release has failed and
 * those behind it stay the caller's, and all do if there is no common event. */
TARN_GPU_API struct _cl_event* tarn_serv_gpu_coalesce_events(int* status,
                                                             struct _cl_command_queue* queue,
                                                             const tarn_gpu_event_list_t* events);
/** Gives an event back; null is ignored. */
TARN_GPU_API void tarn_serv_gpu_release_event(int* status, struct _cl_event* event);
/** Waits for an event. */
TARN_GPU_API void tarn_serv_gpu_host_wait(int* status, struct _cl_event* event);
/**@}*/

#ifdef __cplusplus
}
#endif

#endif
