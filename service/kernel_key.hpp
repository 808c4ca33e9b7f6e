// SPDX-License-Identifier: Apache-2.0
// By what a program is found in the cache, besides its device and context.
#pragma once

#include <cstddef>
#include <cstdint>

#include "bytes.hpp"

namespace kestrel::tarn::gpu {

struct kernel_key {
  std::int32_t domain;
  const char* name;  // may be null
  forge::byte_view blob;

  /// The blob says it all: the name does not count.
  bool is_self_naming() const;
};

/// Bytes of a caller, none for a null pointer.
forge::byte_view bytes_of(const void* data, std::size_t size);

/// Build options, or a name, as bytes: up to 4,096 of them.
forge::byte_view text_bytes(const char* text);

/// Spreads programs over buckets. Name and blob count up to their 64th character and byte.
std::uint64_t kernel_hash(const void* device, const kernel_key& key);

/// Compares up to the 260th character; null is an empty name.
bool same_names(const char* one, const char* other);
bool same_bytes(forge::byte_view one, forge::byte_view other);

}  // namespace kestrel::tarn::gpu
