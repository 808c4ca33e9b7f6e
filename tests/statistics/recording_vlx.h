/* SPDX-License-Identifier: Apache-2.0
 * What recording_vlx.c has seen, as it lies in the memory of its stream: the header of a stream,
 * then the record. */
#ifndef TARN_TEST_RECORDING_VLX_H
#define TARN_TEST_RECORDING_VLX_H

#include <stdint.h>

struct recorded {
  uint32_t code;
  unsigned char mark;
  unsigned char free_bytes[11];
  int32_t calls;
  int32_t counts[8];
  int64_t offsets[8]; /* bytes from the first call's results */
  int32_t words;
  uint32_t seed[8];
};

#endif
