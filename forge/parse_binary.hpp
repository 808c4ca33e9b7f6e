// SPDX-License-Identifier: Apache-2.0
// What a device binary says about the device that it was made for.
#pragma once

#include "bytes.hpp"
#include "hw_codes.hpp"

namespace kestrel::tarn::forge {

/// Reads a binary of either format, as a driver gives it. Codes are 0 where the binary names a
/// device that is not known.
/// \throws crate::bad_elf: not an ELF file, or it points outside of itself
/// \throws crate::no_binary_section: an ELF file of neither format
/// \throws crate::bad_binary_section: of the older format, but with another layout
detected_hw parse_binary(byte_view binary);

}  // namespace kestrel::tarn::forge
