/* SPDX-License-Identifier: Apache-2.0
 * A caller in C. */
#include "from_c.h"

void fill_from_c(tarn_gpu_argument_t* four, void* pointer) {
  const uint32_t scalar = 0xdeadbeef;
  tarn_serv_gpu_set_scalar_arg_internal(&four[0], &scalar, sizeof scalar);
  tarn_gpu_set_usm_arg(&four[1], pointer);
  tarn_serv_gpu_set_SLM_arg(&four[2], 256);
  four[3].kind = 7;
  four[3].access = 9;
}

int launch_from_c(struct _cl_command_queue* queue, struct _cl_kernel* kernel,
                  struct _cl_mem* buffer, unsigned scalar, size_t items) {
  int status = 0;
  tarn_gpu_argument_t args[2];
  tarn_gpu_event_list_t list;
  struct _cl_event* events[2];
  struct _cl_event* both;
  tarn_serv_gpu_set_buffer_arg(&args[0], buffer, TARN_GPU_ACCESS_READ_WRITE);
  tarn_serv_gpu_set_scalar_arg_internal(&args[1], &scalar, sizeof scalar);
  events[0] = tarn_serv_gpu_launch_kernel_1D(&status, queue, kernel, args, items, 1, NULL);
  list.events = events;
  list.count = 1;
  list.skip = 0;
  events[1] = tarn_serv_gpu_launch_kernel_1D(&status, queue, kernel, args, items, 1, &list);
  list.count = 2;
  both = tarn_serv_gpu_coalesce_events(&status, queue, &list);
  tarn_serv_gpu_host_wait(&status, both);
  tarn_serv_gpu_release_event(&status, both);
  return status;
}
