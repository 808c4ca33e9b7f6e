// SPDX-License-Identifier: Apache-2.0
// The core's allocator, watched and made to fail. A program that links serv_memory.cpp has
// tarn_serv_malloc, tarn_serv_realloc and tarn_serv_free replaced by functions that pass on to the
// core.
#pragma once

#include <cstddef>
#include <cstdint>

namespace serv_memory {

/// While it lives, the allocation that comes after `after` others of this thread fails once. A
/// realloc counts as an allocation.
class failure {
 public:
  explicit failure(int after);
  failure(const failure&) = delete;
  failure& operator=(const failure&) = delete;
  ~failure();

  bool happened() const;
};

/// Blocks of all threads that have not been given back.
std::int64_t live_blocks();

struct request {
  std::size_t size;
  std::size_t alignment;
};
/// The latest one of this thread that was no realloc, and the latest one that was.
request last_malloc();
request last_realloc();

}  // namespace serv_memory
