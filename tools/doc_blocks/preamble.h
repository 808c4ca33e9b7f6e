// SPDX-License-Identifier: Apache-2.0
// What the C fragments of the manual's pages find in front of them, and how they are run.
// split.awk puts each into a function of its own.
#ifndef TARN_DOC_BLOCKS_PREAMBLE_H
#define TARN_DOC_BLOCKS_PREAMBLE_H

#include <math.h>
#include <stdint.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <tarn_rvx.h>

// Ends the program with the page and the line where a condition does not hold.
#define check(condition) \
  ((condition)           \
       ? (void)0         \
       : (fprintf(stderr, "%s:%d: does not hold: %s\n", __FILE__, __LINE__, #condition), exit(1)))

typedef struct {
  int line;  // where it stands on the page
  void (*run)(void);
} doc_block;

// Runs the blocks up to the one without a function; a line in front of the output of each says
// whose it is.
static int run_blocks(const doc_block* block) {
  for (; block->run; ++block) {
    printf("== block %d\n", block->line);
    block->run();
    fflush(stdout);
  }
  return 0;
}

#endif
