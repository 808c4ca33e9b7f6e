/* SPDX-License-Identifier: Apache-2.0
 * A statistics library that records what reaches it and draws nothing, for tests of what travels.
 */
#include "recording_vlx.h"

#include <string.h>

#define EXPORTED __attribute__((visibility("default")))

static struct recorded stream_record = {.mark = 1};
static const char* first_results;

EXPORTED int __rvxNewStreamEx(void** stream, int code, int n, const uint32_t* params) {
  stream_record.code = (uint32_t)code;
  stream_record.calls = 0;
  stream_record.words = n;
  memcpy(stream_record.seed, params, (size_t)n * sizeof *params);
  *stream = &stream_record;
  return 0;
}

EXPORTED int _rvxiRngUniformBits(int method, void* stream, int n, uint32_t* r) {
  (void)method;
  (void)stream;
  if (stream_record.calls == 0) {
    first_results = (const char*)r;
  }
  stream_record.counts[stream_record.calls] = n;
  stream_record.offsets[stream_record.calls] = (const char*)r - first_results;
  return ++stream_record.calls == 4 ? -1001 : 0; /* the fourth piece finds no memory */
}
