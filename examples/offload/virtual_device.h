/* SPDX-License-Identifier: Apache-2.0 */
/* What an OpenMP compiler and its runtime give a program that offloads, for the examples, which are
 * built without one: an interop object and memory, of a virtual GPU. A program of such a compiler
 * writes what stands beside each function instead. */
#ifndef TARN_EXAMPLES_VIRTUAL_DEVICE_H
#define TARN_EXAMPLES_VIRTUAL_DEVICE_H

#include <stddef.h>

#ifdef __cplusplus
extern "C" {
#endif

/* #pragma omp interop init(targetsync : object); null if there is no GPU. */
void* device_interop(void);

/* #pragma omp interop destroy(object) */
void device_release(void* object);

/* omp_target_alloc, omp_target_free */
void* device_alloc(size_t bytes);
void device_free(void* memory);

/* omp_target_memcpy from the device to the host */
void device_read(void* host, const void* memory, size_t bytes);

#ifdef __cplusplus
}
#endif

#endif
