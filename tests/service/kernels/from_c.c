/* SPDX-License-Identifier: Apache-2.0
 * A caller in C. */
#include "from_c.h"

int acquire_from_c(struct _cl_command_queue* queue, const char* source, const char* name) {
  int status = 0;
  cl_handle* handle = NULL;
  tarn_gpu_kernel_struct_t* first =
      tarn_serv_gpu_get_OCL_kernel(&status, queue, TARN_GPU_DOMAIN_BLAS, source, name, "");
  tarn_gpu_kernel_struct_t* second =
      tarn_gpu_get_cached_kernel(&status, queue, TARN_GPU_DOMAIN_BLAS, name, "", 0, NULL, NULL);
  if (first == NULL || second == NULL || first->kernel == second->kernel ||
      first->state != TARN_GPU_KERNEL_TAKEN) {
    return -1;
  }
  tarn_serv_gpu_release_kernel(&status, first);
  tarn_serv_gpu_release_kernel(&status, second);
  if (status == 0) {
    status = TARN_CL_Create_Handle(&handle, queue);
  }
  TARN_CL_Destroy_Handle(handle);
  return status;
}
