// SPDX-License-Identifier: Apache-2.0
// Images in memory. The check sum is FNV-1a of 32 bits (Fowler, Noll, Vo) over the whole image
// with the sum's own field zero. Each step of it is a bijection of the sum, so that damage to a
// single byte is always found; other damage passes with probability 2^-32.
#include "image.hpp"

#include <cstring>

#include "tarn_rvx.h"

namespace tarn::statistics {

namespace {

std::uint32_t check_sum(const stream_header& header, const std::uint8_t* state) {
  stream_header plain = header;
  plain.check = 0;
  std::uint8_t head[sizeof plain];
  std::memcpy(head, &plain, sizeof head);

  std::uint32_t sum = 0x811C9DC5;
  const auto add = [&sum](const std::uint8_t* bytes, std::size_t size) {
    for (std::size_t i = 0; i < size; ++i)
      sum = (sum ^ bytes[i]) * 0x01000193;
  };
  add(head, sizeof head);
  add(state, state_bytes(header));
  return sum;
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
  header.check = check_sum(header, state);
  std::memcpy(image, &header, sizeof header);
  std::memcpy(image + sizeof header, state, state_bytes(header));
}

std::size_t image_length(const std::uint8_t* image) {
  const stream_header header = header_of(image);
  const bool ours = header.mark == stream_mark && header.version == image_version &&
                    header.spare == 0 && header.length >= sizeof header &&
                    find_engine(header.code) != nullptr;
  return ours ? header.length : 0;
}

int read_image(const std::uint8_t* image, std::size_t length, stream_header** out) {
  if (length < sizeof(stream_header) || image_length(image) != length)
    return RVX_STATUS_BAD_IMAGE;
  const stream_header header = header_of(image);
  const std::uint8_t* state = image + sizeof header;
  // The engine looks first: it knows which lengths exist, and a damaged length must not make the
  // check sum read behind the caller's memory.
  if (!find_engine(header.code)->ops->accepts(state, state_bytes(header)) ||
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
