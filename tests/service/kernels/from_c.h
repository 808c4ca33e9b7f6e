/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TARN_TESTS_KERNELS_FROM_C_H
#define TARN_TESTS_KERNELS_FROM_C_H

#include <tarn_gpu_kernel.h>

#ifdef __cplusplus
extern "C" {
#endif

/* A kernel from source, taken twice and given back, and a handle over the queue; the first status
 * that is not 0. */
int acquire_from_c(struct _cl_command_queue* queue, const char* source, const char* name);

#ifdef __cplusplus
}
#endif

#endif
