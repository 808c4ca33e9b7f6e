// SPDX-License-Identifier: Apache-2.0
// From the generator's numbering of hardware to what records say of a device.
#pragma once

#include <cstdint>

#include "hw_codes.hpp"
#include "tarn_gpu.h"

namespace kestrel::tarn::gpu {

struct architecture {
  tarn_gpu_arch_t arch;
  std::uint32_t stepping;
  std::uint32_t flags;  // of tarn_gpu_flag_t
};

architecture architecture_of(const forge::detected_hw& found);

}  // namespace kestrel::tarn::gpu
