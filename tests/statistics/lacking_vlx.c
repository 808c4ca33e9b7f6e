/* SPDX-License-Identifier: Apache-2.0
 * A statistics library with two entries, for the test of a missing one. The stream it makes is a
 * static record with a mark. */
#include <stdint.h>

#define EXPORTED __attribute__((visibility("default")))

static unsigned char record[64] = {0, 0, 0, 1, 1};

EXPORTED int __rvxNewStreamEx(void** stream, int code, int n, const uint32_t* params) {
  (void)code;
  (void)n;
  (void)params;
  *stream = record;
  return 0;
}

EXPORTED int __rvxGetStreamSize(void* stream) {
  (void)stream;
  return 4711;
}
