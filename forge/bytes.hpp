// SPDX-License-Identifier: Apache-2.0
// Bytes that somebody else made, and the only way to read numbers out of them: offsets and lengths
// are 64 bits wide and compared with what is there before anything is touched, and records are
// copied out, so that they may lie at any address.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>
#include <vector>

namespace kestrel::tarn::forge {

using byte_vector = std::vector<std::uint8_t>;

/// A look at bytes that live elsewhere. `data` may be null when `size` is 0.
struct byte_view {
  const std::uint8_t* data = nullptr;
  std::size_t size = 0;

  byte_view() = default;
  byte_view(const void* start, std::size_t count)
      : data(static_cast<const std::uint8_t*>(start)), size(count) {}
  byte_view(const byte_vector& bytes) : data(bytes.data()), size(bytes.size()) {}

  /// Whether the `length` bytes from `offset` on are all there.
  bool holds(std::uint64_t offset, std::uint64_t length) const {
    return offset <= size && length <= size - offset;
  }

  /// Copies a record out, in the byte order of the machine, which is little-endian wherever there
  /// are such devices. False, and `record` as it was, if it is not all there.
  template <typename Record>
  bool read(std::uint64_t offset, Record& record) const {
    static_assert(std::is_trivially_copyable_v<Record>);
    if (!holds(offset, sizeof record)) {
      return false;
    }
    std::memcpy(&record, data + offset, sizeof record);
    return true;
  }
};

/// Puts a record at a place that is known to be there.
template <typename Record>
void put(std::uint8_t* bytes, std::uint64_t offset, const Record& record) {
  static_assert(std::is_trivially_copyable_v<Record>);
  std::memcpy(bytes + offset, &record, sizeof record);
}

}  // namespace kestrel::tarn::forge
