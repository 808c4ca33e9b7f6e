/* SPDX-License-Identifier: Apache-2.0 */
/* A user's C program: the 1000 uniforms of consumer.cpp from the statistics library alone, and
 * the same text printed. */
#include <stdint.h>
#include <stdio.h>
#include <tarn_rvx.h>

int main(void) {
  enum { count = 1000 };
  static float values[count];
  rvx_stream stream = NULL;
  double sum = 0;
  int i;
  if (rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 42) != RVX_STATUS_OK ||
      rvxsRngUniform(RVX_RNG_METHOD_UNIFORM_STD, stream, count, values, 0.0f, 1.0f) !=
          RVX_STATUS_OK) {
    return 1;
  }
  for (i = 0; i < count; ++i) {
    sum += (double)values[i];
    if (i % 100 == 0) {
      printf("%d %a\n", i, (double)values[i]);
    }
  }
  printf("mean %.6f\n", sum / count);
  return rvxDeleteStream(&stream) == RVX_STATUS_OK ? 0 : 1;
}
