/* SPDX-License-Identifier: Apache-2.0
 * A C program that uses the statistics library by its public header alone. */
#include <stdio.h>
#include <tarn_rvx.h>

static int failures = 0;

static void expect(int good, const char* what) {
  if (!good) {
    fprintf(stderr, "failed: %s\n", what);
    ++failures;
  }
}

int main(void) {
  /* Philox4x32-10 of counter 0 and key 0, from the authors' published vectors. */
  static const uint32_t published[4] = {0x6627E8D5u, 0xE169C58Du, 0xBC57AC4Cu, 0x9B00DBD8u};
  rvx_stream stream = NULL;
  uint32_t words[4];
  double reals[100];
  int i;

  expect(rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 0) == RVX_STATUS_OK, "new stream");
  expect(rvxiRngUniformBits(0, stream, 4, words) == RVX_STATUS_OK, "words");
  for (i = 0; i < 4; ++i)
    expect(words[i] == published[i], "published words");
  expect(rvxdRngUniform(RVX_RNG_METHOD_UNIFORM_STD, stream, 100, reals, 2.0, 3.0) == 0, "reals");
  for (i = 0; i < 100; ++i)
    expect(2.0 <= reals[i] && reals[i] < 3.0, "range");
  expect(rvxDeleteStream(&stream) == RVX_STATUS_OK && stream == NULL, "delete");
  return failures;
}
