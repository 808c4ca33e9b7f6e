/* SPDX-License-Identifier: Apache-2.0 */
/** \file
 * Device services of libtarn_rng.so on OpenCL queues: which device stands behind a queue, and what
 * it can do. Usable from C and C++; kestrel/tarn/gpu/device_info.hpp has the same for SYCL queues.
 *
 * Functions with a `status` store what fails in `*status`, but only while that is 0, so that the
 * first failure of a chain of calls survives: an OpenCL code, or -6 when memory is exhausted.
 * `queue` is a cl_command_queue. All functions may be called from any thread at any time. */
#ifndef TARN_GPU_H
#define TARN_GPU_H

#include <stdbool.h>
#include <stdint.h>

#include "tarn_gpu_api.h"

#ifdef __cplusplus
extern "C" {
#endif

/** \cond */
struct _cl_command_queue;
struct _cl_context;
struct _cl_device_id;
/** \endcond */

/** Generations of devices. */
typedef enum tarn_gpu_arch_t {
  TARN_GPU_ARCH_UNKNOWN = 0, /**< none of these, or not found out */
  TARN_GPU_ARCH_FIR = 1,     /**< Fir */
  TARN_GPU_ARCH_ELM = 2,     /**< Elm */
  TARN_GPU_ARCH_ASH = 3,     /**< Ash */
  TARN_GPU_ARCH_OAK = 4,     /**< Oak */
  TARN_GPU_ARCH_YEW = 5,     /**< Yew */
  TARN_GPU_ARCH_PINE = 6,    /**< Pine */
  TARN_GPU_ARCH_LARCH = 7    /**< Larch */
} tarn_gpu_arch_t;

/** What drives a device. */
typedef enum tarn_gpu_backend_t {
  TARN_GPU_BACKEND_OF_QUEUE = -2, /**< inside the library only: whatever the queue has */
  TARN_GPU_BACKEND_UNKNOWN = -1,  /**< neither of the two */
  TARN_GPU_BACKEND_OPENCL = 0,    /**< OpenCL */
  TARN_GPU_BACKEND_LEVEL_ZERO = 1 /**< Level Zero */
} tarn_gpu_backend_t;

/** What follows from the generation and, within it, the family of a device. */
typedef enum tarn_gpu_flag_t {
  /** Fir, Oak, Pine, Larch, and those of Yew whose family is known and is not 7. */
  TARN_GPU_FLAG_GENERATION = 1,
  /** Families from 5 on, but not 8 and 12. */
  TARN_GPU_FLAG_FAMILY = 2
} tarn_gpu_flag_t;

/** What is known of a device; 48 bytes. */
typedef struct tarn_gpu_device_info_t {
  void* device_id;            /**< cl_device_id or ze_device_handle_t; null for other backends */
  int32_t lock;               /**< of the library's own record; 0 in copies */
  bool arch_ready;            /**< the architecture has been decided */
  tarn_gpu_arch_t arch;       /**< the architecture; unknown until decided */
  uint32_t stepping;          /**< revision of the hardware; 0 until decided */
  bool binary_checked;        /**< it has been tested whether native kernels are safe */
  bool binary_usable;         /**< the verdict of that test */
  int32_t tile_count;         /**< parts that can be used as devices of their own; >= 1 */
  int32_t eu_count;           /**< compute units */
  int32_t max_workgroup_size; /**< work-items in one work-group, the low 32 bits of the number */
  uint32_t flags;             /**< bits of tarn_gpu_flag_t; 0 until decided */
  tarn_gpu_backend_t backend; /**< what drives the device */
} tarn_gpu_device_info_t;

/** The device of a queue (CL_QUEUE_DEVICE), or null. `*status` is left as it is even then. */
TARN_GPU_API void* tarn_serv_gpu_get_device_id(int* status, struct _cl_command_queue* queue);

/** Copies what is known of the queue's device to `*info`, without deciding the architecture.
 * Returns 0, or 1 on failure, when `*info` is left as it is. */
TARN_GPU_API int tarn_serv_gpu_get_device_info(struct _cl_command_queue* queue,
                                               tarn_gpu_device_info_t* info);
/** The same once the architecture has been decided. */
TARN_GPU_API int tarn_serv_gpu_get_device_info_with_arch(struct _cl_command_queue* queue,
                                                         tarn_gpu_device_info_t* info);

/** The architecture of the queue's device. It is found out once for each device, by asking the
 * driver and, if that has no answer, by compiling a kernel that does nothing. When this fails the
 * architecture is unknown for good, and no status tells. */
TARN_GPU_API tarn_gpu_arch_t tarn_serv_gpu_get_architecture(int* status,
                                                            struct _cl_command_queue* queue);
/** The same with the stepping. Either pointer may be null; on failure both results are 0. */
TARN_GPU_API void tarn_serv_gpu_get_architecture_and_stepping(int* status,
                                                              struct _cl_command_queue* queue,
                                                              tarn_gpu_arch_t* arch,
                                                              uint32_t* stepping);
/** The flags of the queue's device, its architecture decided; 0 on failure. */
TARN_GPU_API uint32_t tarn_serv_gpu_get_device_flags(int* status, struct _cl_command_queue* queue);

/** How many parts the queue's device has; >= 1, and 1 on failure. */
TARN_GPU_API int tarn_serv_gpu_get_tile_count(struct _cl_command_queue* queue);
/** How many compute units it has; 0 on failure. */
TARN_GPU_API int tarn_serv_gpu_get_eu_count(struct _cl_command_queue* queue);
/** How many work-items one of its work-groups may have; 0 on failure. */
TARN_GPU_API int tarn_gpu_get_max_workgroup_size(struct _cl_command_queue* queue);

/** The device and the context of a queue. Either pointer may be null; on failure both results are.
 * No reference is added. */
TARN_GPU_API void tarn_gpu_get_cl_device_context(int* status, struct _cl_command_queue* queue,
                                                 struct _cl_device_id** device,
                                                 struct _cl_context** context);

/** Releases what the library holds of native objects in its tables, which are then filled anew when
 * they are needed. Called by the core library before the process ends; nothing may be submitted to
 * a device meanwhile. */
TARN_GPU_API void tarn_sycl_destructor(void);
/** The same for a caller inside that function, or in a process with one thread left: without the
 * lock that keeps two of them apart. */
TARN_GPU_API void tarn_sycl_destructor_local(void);

#ifdef __cplusplus
}
#endif

#endif
