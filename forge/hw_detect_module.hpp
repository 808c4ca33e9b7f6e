// SPDX-License-Identifier: Apache-2.0
// The smallest kernel there is, as a SPIR-V module: what a Level Zero driver compiles so that its
// binary can be looked at.
#pragma once

#include <cstddef>
#include <cstdint>

namespace kestrel::tarn::forge {

inline constexpr std::size_t hw_detect_module_words = 49;

/// 196 bytes, in the byte order of the machine, as SPIR-V allows.
extern const std::uint32_t hw_detect_module[hw_detect_module_words];

}  // namespace kestrel::tarn::forge
