// SPDX-License-Identifier: Apache-2.0
// The newer device binary, made from its parts.
#pragma once

#include <cstdint>
#include <string>

#include "bytes.hpp"

namespace kestrel::tarn::forge {

/// A binary with one kernel: its name, its metadata (text, as kernel_interface writes it), its
/// code, and a note that names the target by its core family number. The length is a multiple
/// of 16.
byte_vector write_binary(std::uint32_t core_family, const std::string& kernel_name,
                         const std::string& metadata, byte_view code);

}  // namespace kestrel::tarn::forge
