// SPDX-License-Identifier: Apache-2.0
// Hashes and comparisons of keys.
#include "kernel_key.hpp"

#include <algorithm>
#include <cstring>

namespace kestrel::tarn::gpu {
namespace {

constexpr std::size_t compared_name = 260;
constexpr std::size_t longest_text = 4096;
constexpr std::size_t hashed_bytes = 64;
constexpr std::uint8_t self_naming_mark = 0xFF;

forge::byte_view text_bytes(const char* text, std::size_t limit) {
  return text == nullptr ? forge::byte_view() : forge::byte_view(text, ::strnlen(text, limit));
}

/// Bytes from 0x80 on count as negative numbers.
std::uint64_t weighted_sum(forge::byte_view bytes) {
  const std::size_t count = std::min(bytes.size, hashed_bytes);
  std::uint64_t sum = 0;
  for (std::size_t i = 0; i < count; ++i) {
    const int term = static_cast<int>(i) * 69 * static_cast<signed char>(bytes.data[i]);
    sum += static_cast<std::uint64_t>(std::int64_t{term});
  }
  return sum;
}

}  // namespace

bool kernel_key::is_self_naming() const {
  return blob.size != 0 && blob.data[0] == self_naming_mark;
}

forge::byte_view bytes_of(const void* data, std::size_t size) {
  return data == nullptr ? forge::byte_view() : forge::byte_view(data, size);
}

forge::byte_view text_bytes(const char* text) {
  return text_bytes(text, longest_text);
}

std::uint64_t kernel_hash(const void* device, const kernel_key& key) {
  // The product wraps in 32 bits.
  const auto start = static_cast<std::int32_t>(static_cast<std::uint32_t>(key.domain) * 35U);
  const auto low = static_cast<std::uint32_t>(reinterpret_cast<std::uintptr_t>(device));
  std::uint64_t hash = static_cast<std::uint64_t>(std::int64_t{start}) ^ low;
  if (!key.is_self_naming()) {
    hash += weighted_sum(text_bytes(key.name, hashed_bytes));
  }
  return hash + weighted_sum(key.blob);
}

bool same_names(const char* one, const char* other) {
  return same_bytes(text_bytes(one, compared_name), text_bytes(other, compared_name));
}

bool same_bytes(forge::byte_view one, forge::byte_view other) {
  return one.size == other.size &&
         (one.size == 0 || std::memcmp(one.data, other.data, one.size) == 0);
}

}  // namespace kestrel::tarn::gpu
