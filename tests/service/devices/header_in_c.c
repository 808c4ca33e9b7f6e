/* SPDX-License-Identifier: Apache-2.0 */
/* The device functions as a C program sees them that also has the OpenCL headers, and the layout of
 * the record. */
#include <stddef.h>

#include <CL/cl.h>

#include "tarn_gpu.h"

_Static_assert(sizeof(tarn_gpu_device_info_t) == 48, "the record");
_Static_assert(offsetof(tarn_gpu_device_info_t, lock) == 8, "after a pointer");
_Static_assert(offsetof(tarn_gpu_device_info_t, arch_ready) == 12, "one byte, padded");
_Static_assert(offsetof(tarn_gpu_device_info_t, arch) == 16, "32 bits");
_Static_assert(offsetof(tarn_gpu_device_info_t, stepping) == 20, "32 bits");
_Static_assert(offsetof(tarn_gpu_device_info_t, binary_checked) == 24, "one byte");
_Static_assert(offsetof(tarn_gpu_device_info_t, binary_usable) == 25, "one byte, padded");
_Static_assert(offsetof(tarn_gpu_device_info_t, tile_count) == 28, "32 bits");
_Static_assert(offsetof(tarn_gpu_device_info_t, eu_count) == 32, "32 bits");
_Static_assert(offsetof(tarn_gpu_device_info_t, max_workgroup_size) == 36, "32 bits");
_Static_assert(offsetof(tarn_gpu_device_info_t, flags) == 40, "32 bits");
_Static_assert(offsetof(tarn_gpu_device_info_t, backend) == 44, "32 bits");

typedef void (*any_function)(void);

void device_functions_seen_from_c(any_function seen[12]);

void device_functions_seen_from_c(any_function seen[12]) {
  void* (*id)(int*, cl_command_queue) = tarn_serv_gpu_get_device_id;
  int (*info)(cl_command_queue, tarn_gpu_device_info_t*) = tarn_serv_gpu_get_device_info;
  int (*info_with_arch)(cl_command_queue, tarn_gpu_device_info_t*) =
      tarn_serv_gpu_get_device_info_with_arch;
  tarn_gpu_arch_t (*arch)(int*, cl_command_queue) = tarn_serv_gpu_get_architecture;
  void (*stepping)(int*, cl_command_queue, tarn_gpu_arch_t*, uint32_t*) =
      tarn_serv_gpu_get_architecture_and_stepping;
  uint32_t (*flags)(int*, cl_command_queue) = tarn_serv_gpu_get_device_flags;
  int (*tiles)(cl_command_queue) = tarn_serv_gpu_get_tile_count;
  int (*units)(cl_command_queue) = tarn_serv_gpu_get_eu_count;
  int (*group)(cl_command_queue) = tarn_gpu_get_max_workgroup_size;
  void (*context)(int*, cl_command_queue, cl_device_id*, cl_context*) =
      tarn_gpu_get_cl_device_context;
  seen[0] = (any_function)id;
  seen[1] = (any_function)info;
  seen[2] = (any_function)info_with_arch;
  seen[3] = (any_function)arch;
  seen[4] = (any_function)stepping;
  seen[5] = (any_function)flags;
  seen[6] = (any_function)tiles;
  seen[7] = (any_function)units;
  seen[8] = (any_function)group;
  seen[9] = (any_function)context;
  seen[10] = tarn_sycl_destructor;
  seen[11] = tarn_sycl_destructor_local;
}
