/* SPDX-License-Identifier: Apache-2.0
 * What a caller in C does with records of kernel arguments and events. */
#ifndef FROM_C_H
#define FROM_C_H

#include "tarn_gpu_launch.h"

#ifdef __cplusplus
extern "C" {
#endif

/* A scalar 0xdeadbeef of 4 bytes, a pointer, 256 bytes of local memory, and a record filled by hand
 * with kind 7 and access 9. */
void fill_from_c(tarn_gpu_argument_t* four, void* pointer);

/* Launches `kernel`, which takes a pointer and a scalar of 4 bytes, over `items` work-items. */
int launch_from_c(struct _cl_command_queue* queue, struct _cl_kernel* kernel,
                  struct _cl_mem* buffer, unsigned scalar, size_t items);

#ifdef __cplusplus
}
#endif

#endif
