// SPDX-License-Identifier: Apache-2.0
// The stream record: a header of 16 bytes, and from byte 16 on the engine's state. Clients read
// the code at byte 0, the mark at byte 4 and the state in place, so these offsets are fixed.
#pragma once

#include <cstddef>
#include <cstdint>

#include "engine.hpp"

namespace tarn::statistics {

struct stream_header {
  std::uint32_t code;
  std::uint8_t mark;
  std::uint8_t version;      // of the saved image
  std::uint16_t head_check;  // of the four other fields in a saved image; 0 in a live stream
  std::uint32_t length;      // bytes of header and state
  std::uint32_t check;       // of the whole saved image; 0 in a live stream
};
static_assert(sizeof(stream_header) == 16);
static_assert(offsetof(stream_header, code) == 0 && offsetof(stream_header, mark) == 4);

inline constexpr std::uint8_t stream_mark = 1;
inline constexpr std::uint8_t image_version = 1;

inline void* state_of(stream_header* stream) {
  return stream + 1;
}
inline const void* state_of(const stream_header* stream) {
  return stream + 1;
}
inline std::size_t state_bytes(const stream_header& header) {
  return header.length - sizeof(stream_header);
}

// A usable stream and its engine.
struct live_stream {
  stream_header* record;
  const engine_row* engine;

  void* state() const { return state_of(record); }
};

// Checks a handle from outside: not null, marked, of a known engine, in a possible state. Fills
// `found` and returns 0, or returns the negative status. Does not see a handle that dangles.
int find_stream(void* handle, live_stream& found);

// A record of `length` bytes, its header filled in for `code`; null when memory is exhausted.
stream_header* allocate_stream(std::uint32_t code, std::size_t length);

// Clears the mark, so that a dangling handle is noticed while the memory is not used again.
void free_stream(stream_header* stream);

}  // namespace tarn::statistics
