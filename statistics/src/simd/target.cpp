// SPDX-License-Identifier: Apache-2.0
// The choice of the SIMD target: the processor's best, or TARN_SIMD_TARGET.
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

// The bit of the target `name`, if this library has it and the processor can run it, else 0.
std::int64_t usable_target(const char* name, std::int64_t usable) {
  for (std::int64_t rest = usable; rest != 0; rest &= rest - 1) {
    const std::int64_t bit = rest & -rest;
    if (std::strcmp(name, hwy::TargetName(bit)) == 0)
      return bit;
  }
  return 0;
}

std::size_t choose_row() {
  const std::int64_t usable = HWY_TARGETS & (hwy::SupportedTargets() | HWY_STATIC_TARGET);
  std::int64_t targets = usable;
  const char* wish = std::getenv("TARN_SIMD_TARGET");
  if (wish != nullptr && *wish != '\0' && std::strcmp(wish, "best") != 0) {
    targets = usable_target(wish, usable);
    if (targets == 0) {
      tarn_serv_format_print(1,
                             "TARN WARNING: TARN_SIMD_TARGET=%s is not a target of this "
                             "processor and is ignored\n",
                             1, wish);
      targets = usable;
    }
  }
  hwy::ChosenTarget chosen;
  chosen.Update(targets);
  return chosen.GetIndex();
}

}  // namespace

std::size_t simd_row() {
  static const std::size_t row = choose_row();
  return row;
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
