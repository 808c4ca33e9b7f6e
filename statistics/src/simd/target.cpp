// SPDX-License-Identifier: Apache-2.0
// The choice of the SIMD target: the processor's best, or TARN_SIMD_TARGET. AVX3_DL is on the list
// since some kernels are compiled for it besides the targets that all are.
#define HWY_WANT_AVX3_DL 1
#include "simd/target.hpp"

#include <atomic>
#include <cstdint>
#include <cstdlib>
#include <cstring>

#include <hwy/highway.h>

#include "raw_entries.hpp"
#include "tarn_serv.h"

namespace tarn::statistics {

namespace {

std::atomic<const char*> latest{""};

// The bit of the target `name` of the `targets`, or 0.
std::int64_t target_of(const char* name, std::int64_t targets) {
  for (std::int64_t rest = targets; rest != 0; rest &= rest - 1) {
    const std::int64_t bit = rest & -rest;
    if (std::strcmp(name, hwy::TargetName(bit)) == 0)
      return bit;
  }
  return 0;
}

// The targets that kernels may be called for.
std::int64_t choose_targets() {
  const std::int64_t usable = HWY_TARGETS & (hwy::SupportedTargets() | HWY_STATIC_TARGET);
  const char* wish = std::getenv("TARN_SIMD_TARGET");
  if (wish == nullptr || *wish == '\0' || std::strcmp(wish, "best") == 0)
    return usable;
  const std::int64_t wished = target_of(wish, usable);
  if (wished == 0) {
    tarn_serv_format_print(1,
                           "TARN WARNING: TARN_SIMD_TARGET=%s is not a target of this "
                           "processor and is ignored\n",
                           1, wish);
    return usable;
  }
  return usable & -wished;  // better targets have lower bits
}

}  // namespace

std::size_t simd_row(std::int64_t targets) {
  static const std::int64_t chosen = choose_targets();
  hwy::ChosenTarget row;
  row.Update(targets & chosen);
  return row.GetIndex();
}

void note_simd_target(const char* name) {
  // Threads share the line with the name: it is written only when the name changes.
  if (latest.load(std::memory_order_relaxed) != name)
    latest.store(name, std::memory_order_relaxed);
}

const char* latest_simd_target() {
  return latest.load(std::memory_order_relaxed);
}

}  // namespace tarn::statistics

const char* __rvxGetSimdTarget(void) {
  return tarn::statistics::latest_simd_target();
}
