/* SPDX-License-Identifier: Apache-2.0 */
/* Stands for the statistics library in the tests of the loader; built once for each place. */
__attribute__((visibility("default"))) const char* fake_vlx_place(void);

const char* fake_vlx_place(void) {
  return TARN_FAKE_PLACE;
}
