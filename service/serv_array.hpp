// SPDX-License-Identifier: Apache-2.0
// Memory of the device tables, from the core's allocator.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <new>
#include <tarn_serv.h>
#include <type_traits>
#include <utility>

namespace kestrel::tarn::gpu {

constexpr std::size_t record_alignment = 64;  // a cache line, so that records share none

/// Makes room for `capacity` elements and keeps those that are there. False when memory is
/// exhausted; all is then as before.
template <typename T>
bool resize_array(T*& elements, std::int32_t& present, std::int32_t capacity) {
  static_assert(std::is_trivially_copyable_v<T>, "elements move as bytes");
  void* const moved =
      tarn_serv_realloc(elements, static_cast<std::size_t>(capacity) * sizeof(T), record_alignment);
  if (moved == nullptr) {
    return false;
  }
  elements = static_cast<T*>(moved);
  present = capacity;
  return true;
}

struct record_deleter {
  template <typename T>
  void operator()(T* record) const {
    record->~T();
    tarn_serv_free(record);
  }
};
template <typename T>
using record_owner = std::unique_ptr<T, record_deleter>;

/// Null when memory is exhausted.
template <typename T, typename... Argument>
record_owner<T> make_record(Argument&&... arguments) {
  void* const place = tarn_serv_malloc(sizeof(T), record_alignment);
  return record_owner<T>(place == nullptr ? nullptr
                                          : new (place) T{std::forward<Argument>(arguments)...});
}

}  // namespace kestrel::tarn::gpu
