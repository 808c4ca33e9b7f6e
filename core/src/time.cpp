// SPDX-License-Identifier: Apache-2.0
// The clock, and how durations are written.
#include <cstdio>
#include <time.h>

#include "tarn_serv.h"

double tarn_serv_dsecnd(void) {
  timespec now{};
  ::clock_gettime(CLOCK_MONOTONIC, &now);
  return static_cast<double>(now.tv_sec) + 1e-9 * static_cast<double>(now.tv_nsec);
}

void tarn_serv_format_seconds(char* out, size_t size, double seconds) {
  if (!(seconds > 0.0)) {
    std::snprintf(out, size, "N/A");
  } else if (seconds > 1.0) {
    std::snprintf(out, size, "%.2fs", seconds);
  } else if (seconds * 1e3 > 1.0) {
    std::snprintf(out, size, "%.2fms", seconds * 1e3);
  } else if (seconds * 1e6 > 1.0) {
    std::snprintf(out, size, "%.2fus", seconds * 1e6);
  } else {
    std::snprintf(out, size, "%.0fns", seconds * 1e9);
  }
}
