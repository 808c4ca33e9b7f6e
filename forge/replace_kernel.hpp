// SPDX-License-Identifier: Apache-2.0
// Another code body in an older device binary, for callers that catch exceptions.
#pragma once

#include "bytes.hpp"

namespace kestrel::tarn::forge {

/// Puts `code` in the place of the kernel's code and `patches`, whole patch tokens, behind its
/// patch list. The kernel heap gets 64 bytes of room behind the code and is rounded up to 256; all
/// sizes, section offsets and the checksum are brought up to date. \throws crate::bad_elf,
/// crate::no_binary_section, crate::bad_binary_section: as parse_binary; the
///         last also when the kernel's parts reach beyond their section or the file, or overlap
///         its headers
/// \throws crate::invalid_checksum: the kernel's data are not what the binary's checksum says
/// \throws std::length_error: the new sizes do not fit fields of 32 bits
byte_vector replace_kernel(byte_view binary, byte_view code, byte_view patches);

}  // namespace kestrel::tarn::forge
