// SPDX-License-Identifier: Apache-2.0
// The table of architectures.
#include "architecture.hpp"

namespace kestrel::tarn::gpu {
namespace {

struct architecture_row {
  tarn_gpu_arch_t arch;
  bool generation_flag;
};

constexpr architecture_row rows[] = {
    {TARN_GPU_ARCH_UNKNOWN, false},                                  // hw_unknown
    {TARN_GPU_ARCH_FIR, true},      {TARN_GPU_ARCH_UNKNOWN, false},  // known, and not served
    {TARN_GPU_ARCH_ELM, false},     {TARN_GPU_ARCH_ASH, false},     {TARN_GPU_ARCH_OAK, true},
    {TARN_GPU_ARCH_YEW, true},      {TARN_GPU_ARCH_PINE, true},     {TARN_GPU_ARCH_LARCH, true},
};
static_assert(sizeof rows / sizeof rows[0] == forge::hw_larch + 1, "a row for each generation");

bool has_generation_flag(const forge::detected_hw& found) {
  const bool early_yew = found.hw == forge::hw_yew && (found.family == 0 || found.family == 7);
  return rows[found.hw].generation_flag && !early_yew;
}

bool has_family_flag(forge::family_code family) {
  return family >= 5 && family != 8 && family != 12;
}

}  // namespace

architecture architecture_of(const forge::detected_hw& found) {
  const bool known = found.hw >= forge::hw_unknown && found.hw <= forge::hw_larch;
  std::uint32_t flags = known && has_generation_flag(found) ? TARN_GPU_FLAG_GENERATION : 0;
  flags |= has_family_flag(found.family) ? TARN_GPU_FLAG_FAMILY : 0;
  return {known ? rows[found.hw].arch : TARN_GPU_ARCH_UNKNOWN, found.stepping, flags};
}

}  // namespace kestrel::tarn::gpu
