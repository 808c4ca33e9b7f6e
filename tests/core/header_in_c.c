/* SPDX-License-Identifier: Apache-2.0 */
/* Uses the core as a C program does; returns the number of things that went wrong. */
#include "tarn_serv.h"

int core_used_from_c(void);

int core_used_from_c(void) {
  int wrong = 0;
  int word = 0;
  void* block = tarn_serv_calloc(4, 8, 64);
  wrong += block == NULL;
  block = tarn_serv_realloc(block, 100, 64);
  wrong += block == NULL;
  tarn_serv_free(block);
  tarn_serv_lock(&word);
  wrong += word == 0;
  tarn_serv_unlock(&word);
  wrong += tarn_serv_dsecnd() <= 0;
  wrong += *tarn_serv_verbose_mode() < 0;
  wrong += tarn_serv_verbose_output_file_mode() == NULL;
  wrong += tarn_serv_get_max_threads() < 1;
  return wrong;
}
