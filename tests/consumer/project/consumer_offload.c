/* SPDX-License-Identifier: Apache-2.0 */
/* A user's C program whose runtime has no device: the offload entries by value and by address look
 * at their parameters, say that there is none, and leave the stream where it was. It prints the
 * statuses; consumer_offload.f90 must print the same text. */
#include <stdint.h>
#include <stdio.h>
#include <string.h>
#include <tarn_rvx.h>
#include <tarn_rvx_offload.h>

enum { count = 100 };

static const int32_t method = RVX_RNG_METHOD_STANDARD;
static const int32_t n = count;
static const int64_t method64 = RVX_RNG_METHOD_STANDARD;
static const int64_t n64 = count;

static void by_value(rvx_stream stream, float* r, float a, float b) {
  printf("by value %d %d\n",
         tarn_rvx_vsRngUniform_omp_offload_lp64(method, stream, n, r, a, b, NULL),
         tarn_rvx_vsRngUniform_omp_offload_ilp64(method64, stream, n64, r, a, b, NULL));
}

static void by_address(rvx_stream stream, float* r, float a, float b) {
  printf("by address %d %d\n",
         tarn_rvx_vsrnguniform_omp_offload_lp64(&method, &stream, &n, r, &a, &b, NULL),
         tarn_rvx_vsrnguniform_omp_offload(&method64, &stream, &n64, r, &a, &b, NULL));
}

int main(void) {
  static float values[count], others[count];
  rvx_stream stream = NULL, copy = NULL;
  if (rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 42) != RVX_STATUS_OK ||
      rvxCopyStream(&copy, stream) != RVX_STATUS_OK) {
    return 1;
  }
  by_value(stream, values, 0.0f, 1.0f);
  by_address(stream, values, 0.0f, 1.0f);
  by_value(stream, values, 1.0f, 1.0f);
  by_address(stream, values, 1.0f, 1.0f);
  if (rvxsRngUniform(RVX_RNG_METHOD_UNIFORM_STD, stream, count, values, 0.0f, 1.0f) !=
          RVX_STATUS_OK ||
      rvxsRngUniform(RVX_RNG_METHOD_UNIFORM_STD, copy, count, others, 0.0f, 1.0f) !=
          RVX_STATUS_OK) {
    return 1;
  }
  printf("the stream has %s\n", memcmp(values, others, sizeof values) == 0 ? "not moved" : "moved");
  return rvxDeleteStream(&stream) == RVX_STATUS_OK && rvxDeleteStream(&copy) == RVX_STATUS_OK ? 0
                                                                                              : 1;
}
