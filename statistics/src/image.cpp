// SPDX-License-Identifier: Apache-2.0
// Images in memory. Check sums are FNV-1a of 32 bits (Fowler, Noll, Vo) with the sum's own field
// zero. Each step of it is a bijection of the sum, so that damage to a single byte is always found;
// other damage passes with probability 2^-32. The memory form is told no length, so the header has
// a sum of its own, folded to 16 bits, that is looked at before its length is believed.
#include "image.hpp"

#include <cstring>

#include "tarn_rvx.h"

namespace tarn::statistics {

namespace {

class fnv {
 public:
  void add(const std::uint8_t* bytes, std::size_t size) {
    for (std::size_t i = 0; i < size; ++i)
      sum_ = (sum_ ^ bytes[i]) * 0x01000193;
  }
  void add(const stream_header& header) {
    std::uint8_t bytes[sizeof header];
    std::memcpy(bytes, &header, sizeof header);
    add(bytes, sizeof bytes);
  }
  std::uint32_t sum() const { return sum_; }

 private:
  std::uint32_t sum_ = 0x811C9DC5;
};

std::uint16_t head_check(stream_header header) {
  header.head_check = 0;
  header.check = 0;
  fnv f;
  f.add(header);
  return static_cast<std::uint16_t>(f.sum() ^ f.sum() >> 16);
}

std::uint32_t check_sum(stream_header header, const std::uint8_t* state) {
  header.check = 0;
  fnv f;
  f.add(header);
  f.add(state, state_bytes(header));
  return f.sum();
}

stream_header header_of(const std::uint8_t* image) {
  stream_header header;
  std::memcpy(&header, image, sizeof header);
  return header;
}

}  // namespace

void write_image(const stream_header& stream, std::uint8_t* image) {
  const auto* state = static_cast<const std::uint8_t*>(state_of(&stream));
  stream_header header = stream;
  header.head_check = head_check(header);
  header.check = check_sum(header, state);
  std::memcpy(image, &header, sizeof header);
  std::memcpy(image + sizeof header, state, state_bytes(header));
}

std::size_t image_length(const std::uint8_t* image) {
  const stream_header header = header_of(image);
  const bool ours = header.mark == stream_mark && header.version == image_version &&
                    header.head_check == head_check(header) && header.length >= sizeof header &&
                    find_engine(header.code) != nullptr;
  return ours ? header.length : 0;
}

int read_image(const std::uint8_t* image, std::size_t length, stream_header** out) {
  if (length < sizeof(stream_header) || image_length(image) != length)
    return RVX_STATUS_BAD_IMAGE;
  const stream_header header = header_of(image);
  const std::uint8_t* state = image + sizeof header;
  // The engine looks first: it knows which lengths exist, and the check sum must not read behind
  // the caller's memory.
  if (!find_engine(header.code)
           ->ops->accepts(state, state_bytes(header), header.code & member_mask) ||
      check_sum(header, state) != header.check)
    return RVX_STATUS_BAD_IMAGE;
  stream_header* stream = allocate_stream(header.code, length);
  if (stream == nullptr)
    return RVX_STATUS_NO_MEMORY;
  std::memcpy(state_of(stream), state, state_bytes(header));
  *out = stream;
  return RVX_STATUS_OK;
}

}  // namespace tarn::statistics
