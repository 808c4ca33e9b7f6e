// SPDX-License-Identifier: Apache-2.0
// Stream codes: the engine's number in the upper bits, the member of a set of generators below.
#pragma once

#include <cstdint>

namespace tarn::statistics {

inline constexpr std::uint32_t member_mask = 0xFFFFF;

}  // namespace tarn::statistics
