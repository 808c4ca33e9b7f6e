// SPDX-License-Identifier: Apache-2.0
// The calls that the hardware detection makes, through the runtimes that are bound at first use.
#pragma once

#include "detect_hw.hpp"

namespace kestrel::tarn::gpu {

/// Both records of calls. Taking them binds nothing; calling one of them does.
const forge::detection_calls& bound_detection_calls();

}  // namespace kestrel::tarn::gpu
