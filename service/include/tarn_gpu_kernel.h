/* SPDX-License-Identifier: Apache-2.0 */
/** \file
 * Native kernels for OpenCL queues: from source, SPIR-V or device code to something that can be
 * launched. Usable from C and C++; kestrel/tarn/gpu/kernel.hpp has the same for SYCL queues.
 *
 * A program is built once for each device, context and key, and kept in a cache with its kernels.
 * Its key is the domain, the name, and the bytes of a key; the form that it came in is no part of
 * it. A key that begins with 0xFF names the program by itself: the name does not count then, and
 * may be null. Names are told apart by their first 260 characters.
 *
 * Functions with a `status` store what fails in `*status`, but only while that is 0, and return
 * null: an OpenCL code, -6 when memory is exhausted, -2001 to -2005 when device code cannot be put
 * into a dummy program. `queue` is a cl_command_queue. All functions may be called from any thread
 * at any time. */
#ifndef TARN_GPU_KERNEL_H
#define TARN_GPU_KERNEL_H

#include <stddef.h>
#include <stdint.h>

#include "tarn_gpu_api.h"

#ifdef __cplusplus
extern "C" {
#endif

/** \cond */
struct _cl_command_queue;
struct _cl_kernel;
/** \endcond */

/** Libraries that hand in kernels. Other numbers are taken as they come. */
typedef enum tarn_gpu_domain_t {
  TARN_GPU_DOMAIN_BLAS = 1,  /**< linear algebra */
  TARN_GPU_DOMAIN_DFT = 2,   /**< Fourier transforms */
  TARN_GPU_DOMAIN_LAPACK = 5 /**< linear equations */
} tarn_gpu_domain_t;

/** What a kernel handle is to its holder. */
typedef enum tarn_gpu_kernel_state_t {
  TARN_GPU_KERNEL_FREE = 0,   /**< in the cache */
  TARN_GPU_KERNEL_TAKEN = 1,  /**< in the cache, and handed out */
  TARN_GPU_KERNEL_PRIVATE = 2 /**< in no cache; goes when it is released */
} tarn_gpu_kernel_state_t;

/** A kernel handle; 24 bytes. Whoever has got it sets arguments and launches by `kernel`. */
typedef struct tarn_gpu_kernel_struct_t {
  struct tarn_gpu_kernel_struct_t* next; /**< the cache's */
  uint32_t state;                        /**< of tarn_gpu_kernel_state_t */
  void* kernel;                          /**< cl_kernel; sycl::kernel* for SYCL queues */
} tarn_gpu_kernel_struct_t;

/** Device code. */
typedef struct tarn_gpu_binary_kernel_t {
  size_t code_size;          /**< bytes */
  const void* code;          /**< a program's binary; with a dummy source, the code alone */
  const char* dummy_source;  /**< OpenCL C of a kernel with the same interface, or null */
  const char* build_options; /**< for the dummy source */
} tarn_gpu_binary_kernel_t;

/** SPIR-V. */
typedef struct tarn_gpu_spirv_kernel_t {
  size_t code_size; /**< bytes */
  const void* code; /**< the module */
} tarn_gpu_spirv_kernel_t;

/** \cond */
#ifdef __cplusplus
#define TARN_GPU_LAYOUT(condition) static_assert(condition, "callers know these records")
#else
#define TARN_GPU_LAYOUT(condition) _Static_assert(condition, "callers know these records")
#endif
TARN_GPU_LAYOUT(sizeof(tarn_gpu_kernel_struct_t) == 24);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_kernel_struct_t, next) == 0);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_kernel_struct_t, state) == 8);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_kernel_struct_t, kernel) == 16);
TARN_GPU_LAYOUT(sizeof(tarn_gpu_binary_kernel_t) == 32);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_binary_kernel_t, code_size) == 0);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_binary_kernel_t, code) == 8);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_binary_kernel_t, dummy_source) == 16);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_binary_kernel_t, build_options) == 24);
TARN_GPU_LAYOUT(sizeof(tarn_gpu_spirv_kernel_t) == 16);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_spirv_kernel_t, code_size) == 0);
TARN_GPU_LAYOUT(offsetof(tarn_gpu_spirv_kernel_t, code) == 8);
#undef TARN_GPU_LAYOUT
/** \endcond */

/** A kernel from OpenCL C. The build options, up to 4,096 characters, are the key: with other
 * options the program is another one. */
TARN_GPU_API tarn_gpu_kernel_struct_t* tarn_serv_gpu_get_OCL_kernel(int* status,
                                                                    struct _cl_command_queue* queue,
                                                                    int domain, const char* source,
                                                                    const char* kernel_name,
                                                                    const char* build_options);

/** As above from a program with many kernels, cached by a name of its own. The result is a kernel,
 * not a handle, and the caller's: tarn_serv_gpu_release_kernel_obj gives it back. */
TARN_GPU_API struct _cl_kernel* tarn_serv_gpu_get_OCL_kernel_by_progname(
    int* status, struct _cl_command_queue* queue, int domain, const char* program_name,
    const char* source, const char* kernel_name, const char* build_options);

/** A kernel from SPIR-V; the build options are the key. */
TARN_GPU_API tarn_gpu_kernel_struct_t* tarn_gpu_get_spirv_kernel(
    int* status, struct _cl_command_queue* queue, int domain, const tarn_gpu_spirv_kernel_t* spirv,
    const char* kernel_name, const char* build_options);

/** A kernel from device code, with an empty key and no payload. */
TARN_GPU_API tarn_gpu_kernel_struct_t* tarn_serv_gpu_get_binary_kernel(
    int* status, struct _cl_command_queue* queue, int domain,
    const tarn_gpu_binary_kernel_t* binary, const char* kernel_name);

/** A kernel from device code. With a dummy source the driver compiles that, and the code takes the
 * place of the dummy kernel's in the binary that comes out, so that the driver gets a container of
 * its own making. `payload`, `payload_len` bytes that tarn_gpu_get_cached_kernel hands back, is
 * kept without a dummy source only, and only if it came with the call that built the program. */
TARN_GPU_API tarn_gpu_kernel_struct_t* tarn_gpu_get_binary_kernel_ext(
    int* status, struct _cl_command_queue* queue, int domain,
    const tarn_gpu_binary_kernel_t* binary, const char* kernel_name, const void* key,
    size_t key_len, const void* payload, size_t payload_len);

/** A kernel of a program that is in the cache, or null, and no status, when there is none.
 * `*payload_out` is the cache's, and valid as long as the handle. Either pointer may be null; both
 * results are 0 without a program. */
TARN_GPU_API tarn_gpu_kernel_struct_t* tarn_gpu_get_cached_kernel(
    int* status, struct _cl_command_queue* queue, int domain, const char* kernel_name,
    const void* key, size_t key_len, const void** payload_out, size_t* payload_len_out);

/** Gives a handle back; null is ignored. Handles of the cache are handed out again; they are gone
 * after tarn_sycl_destructor. */
TARN_GPU_API void tarn_serv_gpu_release_kernel(int* status, tarn_gpu_kernel_struct_t* handle);

/** Gives a kernel back; null is ignored. */
TARN_GPU_API void tarn_serv_gpu_release_kernel_obj(int* status, struct _cl_kernel* kernel);

/** 1 if device code that did not come from the driver's own compiler is safe on the queue's device,
 * which is tried once for each device, else 0. A failed trial prints a warning on standard output.
 */
TARN_GPU_API int tarn_serv_gpu_have_binary_kernels(int* status, struct _cl_command_queue* queue);

/** A queue with its device, its context and a table of kernels by name. */
typedef struct cl_handle cl_handle;

/** Makes a handle over a queue, to which no reference is added. Returns 0; 1 for a null
 * `handle_out`; an OpenCL code when the queue does not tell its device and context; -6 when memory
 * is exhausted. `*handle_out` is null on failure. */
TARN_GPU_API int TARN_CL_Create_Handle(cl_handle** handle_out, struct _cl_command_queue* queue);

/** Releases the handle's kernels, and the handle; null is ignored. */
TARN_GPU_API void TARN_CL_Destroy_Handle(cl_handle* handle);

#ifdef __cplusplus
}
#endif

#endif
