// SPDX-License-Identifier: Apache-2.0
// What a driver's word for the version of a device's instruction set has to become, written out
// once more: releases to architecture and flags, without the codes between them.
#pragma once

#include <cstdint>

#include "tarn_gpu.h"

namespace ip_versions {

inline std::uint32_t word(std::uint32_t major, std::uint32_t release, std::uint32_t stepping) {
  return major << 22 | release << 14 | stepping;
}

struct answer {
  bool known;
  tarn_gpu_arch_t arch;
  std::uint32_t flags;
};

inline answer expected(std::uint32_t major, std::uint32_t release) {
  const auto in = [release](std::uint32_t first, std::uint32_t last) {
    return release >= first && release <= last;
  };
  if (major == 9) {
    return {true, TARN_GPU_ARCH_FIR, 1};
  }
  if (major == 11) {
    return {true, TARN_GPU_ARCH_ELM, 0};
  }
  if (major == 20) {
    return {true, TARN_GPU_ARCH_LARCH, 3};
  }
  if (major != 12) {
    return {false, TARN_GPU_ARCH_UNKNOWN, 0};
  }
  if (in(0, 10)) {
    return {true, TARN_GPU_ARCH_ASH, 0};
  }
  if (release == 50) {
    return {true, TARN_GPU_ARCH_OAK, 3};
  }
  if (in(51, 59)) {
    return {true, TARN_GPU_ARCH_YEW, 2};
  }
  if (release == 60 || release == 65) {
    return {true, TARN_GPU_ARCH_PINE, 3};
  }
  if (release == 61) {
    return {true, TARN_GPU_ARCH_PINE, 1};
  }
  if (in(70, 71)) {
    return {true, TARN_GPU_ARCH_YEW, 1};
  }
  if (in(73, 74)) {
    return {true, TARN_GPU_ARCH_YEW, 3};
  }
  return {false, TARN_GPU_ARCH_UNKNOWN, 0};
}

}  // namespace ip_versions
