/* SPDX-License-Identifier: Apache-2.0
 * A stream draws on a device and then goes on on the host. What comes out is one sequence, that of
 * a stream that never left the host. virtual_device.h stands in for the OpenMP compiler.
 */
#include <stdint.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <tarn_rvx.h>
#include <tarn_rvx_offload.h>

#include "virtual_device.h"

enum { half = 10000 };

static void check(int status, const char* what) {
  if (status != RVX_STATUS_OK) {
    fprintf(stderr, "%s: status %d\n", what, status);
    exit(1);
  }
}

/* The next values of the stream, drawn on the device. The entry has waited when it returns. */
static void draw_on_device(rvx_stream stream, float* values) {
  const size_t bytes = half * sizeof *values;
  void* const interop = device_interop();
  float* const memory = interop == NULL ? NULL : device_alloc(bytes);
  if (memory == NULL) {
    fprintf(stderr, "no device\n");
    exit(1);
  }
  check(tarn_rvx_vsRngGaussian_omp_offload_ilp64(RVX_RNG_METHOD_GAUSSIAN_ICDF, stream, half, memory,
                                                 0.0f, 1.0f, interop),
        "gaussians on the device");
  device_read(values, memory, bytes);
  device_free(memory);
  device_release(interop);
}

int main(void) {
  static float values[2 * half], serial[2 * half];
  rvx_stream stream = NULL, other = NULL;
  int same;
  check(rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 2026), "new stream");
  check(rvxCopyStream(&other, stream), "copy");

  draw_on_device(stream, values);
  check(rvxsRngGaussian(RVX_RNG_METHOD_GAUSSIAN_ICDF, stream, half, values + half, 0.0f, 1.0f),
        "gaussians on the host");

  check(rvxsRngGaussian(RVX_RNG_METHOD_GAUSSIAN_ICDF, other, 2 * half, serial, 0.0f, 1.0f),
        "one sequence");
  same = memcmp(values, serial, sizeof values) == 0;
  printf("%d gaussians from the device, %d more from the host: %s\n", half, half,
         same ? "one sequence" : "not one sequence");
  check(rvxDeleteStream(&stream), "delete");
  check(rvxDeleteStream(&other), "delete");
  return same ? 0 : 1;
}
