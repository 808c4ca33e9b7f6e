// SPDX-License-Identifier: Apache-2.0
// Stream records: making, checking and freeing.
#include "stream.hpp"

#include "tarn_rvx.h"
#include "tarn_serv.h"

namespace tarn::statistics {

namespace {
constexpr std::size_t cache_line = 64;  // bytes
}

int find_stream(void* handle, live_stream& found) {
  if (handle == nullptr)
    return RVX_STATUS_NULL_STREAM;
  found.record = static_cast<stream_header*>(handle);
  if (found.record->mark != stream_mark)
    return RVX_STATUS_BAD_MARK;
  found.engine = find_engine(found.record->code);
  if (found.engine == nullptr || found.record->length < sizeof(stream_header) ||
      !found.engine->ops->accepts(found.state(), state_bytes(*found.record),
                                  found.record->code & member_mask))
    return RVX_STATUS_BAD_MARK;
  return RVX_STATUS_OK;
}

stream_header* allocate_stream(std::uint32_t code, std::size_t length) {
  auto* stream = static_cast<stream_header*>(tarn_serv_malloc(length, cache_line));
  if (stream != nullptr)
    *stream = {code, stream_mark, image_version, 0, static_cast<std::uint32_t>(length), 0};
  return stream;
}

void free_stream(stream_header* stream) {
  // Through a volatile lvalue: the compiler would drop a plain store to memory that is freed next.
  *static_cast<volatile std::uint8_t*>(&stream->mark) = 0;
  tarn_serv_free(stream);
}

}  // namespace tarn::statistics
