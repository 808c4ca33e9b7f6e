// SPDX-License-Identifier: Apache-2.0
// The checksum of a kernel's data in the older device binary.
#pragma once

#include <cstddef>
#include <cstdint>

namespace kestrel::tarn::forge {

/// The checksum of `length` bytes, read as little-endian 32-bit words; up to three bytes that are
/// left over count as well. `data` may be null when `length` is 0, and needs no alignment.
std::uint32_t binary_hash(const void* data, std::size_t length) noexcept;

}  // namespace kestrel::tarn::forge
