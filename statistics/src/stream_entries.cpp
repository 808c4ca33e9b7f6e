// SPDX-License-Identifier: Apache-2.0
// The raw stream services.
#include <cstring>
#include <new>
#include <string>

#include "image.hpp"
#include "raw_entries.hpp"
#include "stream.hpp"

namespace {

using namespace tarn::statistics;

// Runs use(name) on a NUL-terminated copy when the caller gave a length.
template <class Use>
int with_name(const char* name, int length, const Use& use) {
  if (name == nullptr)
    return -2;
  if (length < -1)
    return -3;
  if (length == -1)
    return use(name);
  try {
    return use(std::string(name, static_cast<std::size_t>(length)).c_str());
  } catch (const std::bad_alloc&) {
    return RVX_STATUS_NO_MEMORY;
  }
}

int skip(const live_stream& stream, span<std::uint64_t> digits) {
  const engine_ops& engine = *stream.engine->ops;
  if (engine.skip == nullptr)
    return RVX_STATUS_UNSUPPORTED;
  if (engine.remaining != nullptr && digits.data[0] > engine.remaining(stream.state()))
    return RVX_STATUS_END_OF_SEQUENCE;
  try {
    engine.skip(stream.state(), digits);
  } catch (const std::bad_alloc&) {
    return RVX_STATUS_NO_MEMORY;  // long jumps need room; the stream has not moved
  }
  return RVX_STATUS_OK;
}

int load(void** stream, int status, stream_header* loaded) {
  if (status == RVX_STATUS_OK)
    *stream = loaded;
  return status;
}

}  // namespace

int __rvxNewStreamEx(void** stream, int code, int n, const std::uint32_t* params) {
  if (stream == nullptr)
    return RVX_STATUS_NULL_STREAM;
  const engine_row* engine = code < 0 ? nullptr : find_engine(static_cast<std::uint32_t>(code));
  if (engine == nullptr)
    return RVX_STATUS_BAD_CODE;
  if (n < 0)
    return -3;
  if (n > 0 && params == nullptr)
    return -4;
  const span<std::uint32_t> seed{params, static_cast<std::size_t>(n)};
  const auto full_code = static_cast<std::uint32_t>(code);
  const std::size_t size = engine->ops->state_size(seed);
  if (size == bad_seed)
    return RVX_STATUS_BAD_CODE;
  stream_header* made = allocate_stream(full_code, sizeof(stream_header) + size);
  if (made == nullptr)
    return RVX_STATUS_NO_MEMORY;
  const int status = engine->ops->seed(state_of(made), full_code & member_mask, seed);
  if (status == RVX_STATUS_OK)
    *stream = made;
  else
    free_stream(made);
  return status;
}

int __rvxDeleteStream(void** stream) {
  if (stream == nullptr || *stream == nullptr)
    return RVX_STATUS_NULL_STREAM;
  auto* record = static_cast<stream_header*>(*stream);
  if (record->mark != stream_mark)
    return RVX_STATUS_BAD_MARK;
  free_stream(record);
  *stream = nullptr;
  return RVX_STATUS_OK;
}

int __rvxCopyStream(void** out, void* in) {
  if (out == nullptr)
    return RVX_STATUS_NULL_STREAM;
  live_stream from;
  if (const int status = find_stream(in, from); status != RVX_STATUS_OK)
    return status;
  stream_header* copy = allocate_stream(from.record->code, from.record->length);
  if (copy == nullptr)
    return RVX_STATUS_NO_MEMORY;
  std::memcpy(state_of(copy), from.state(), state_bytes(*copy));
  *out = copy;
  return RVX_STATUS_OK;
}

int __rvxLeapfrogStream(void* stream, int idx, int stride) {
  live_stream found;
  if (const int status = find_stream(stream, found); status != RVX_STATUS_OK)
    return status;
  if (found.engine->ops->leapfrog == nullptr)
    return RVX_STATUS_UNSUPPORTED;
  if (stride < 1)
    return -3;
  if (idx < 0 || idx >= stride)
    return -2;
  found.engine->ops->leapfrog(found.state(), static_cast<std::uint32_t>(idx),
                              static_cast<std::uint32_t>(stride));
  return RVX_STATUS_OK;
}

int __rvxSkipAheadStream(void* stream, std::int64_t count) {
  const auto digit = static_cast<std::uint64_t>(count);
  live_stream found;
  if (const int status = find_stream(stream, found); status != RVX_STATUS_OK)
    return status;
  return skip(found, {&digit, 1});
}

int __rvxSkipAheadStreamEx(void* stream, int n, const std::uint64_t* words) {
  live_stream found;
  if (const int status = find_stream(stream, found); status != RVX_STATUS_OK)
    return status;
  if (!found.engine->skip_list)
    return RVX_STATUS_UNSUPPORTED;
  if (n < 0)
    return -2;
  if (n > 0 && words == nullptr)
    return -3;
  return skip(found, {words, static_cast<std::size_t>(n)});
}

int __rvxGetStreamSize(void* stream) {
  live_stream found;
  const int status = find_stream(stream, found);
  return status == RVX_STATUS_OK ? static_cast<int>(found.record->length) : status;
}

int __rvxSaveStreamM(void* stream, std::uint8_t* mem) {
  live_stream found;
  if (const int status = find_stream(stream, found); status != RVX_STATUS_OK)
    return status;
  if (mem == nullptr)
    return -2;
  write_image(*found.record, mem);
  return RVX_STATUS_OK;
}

int __rvxLoadStreamM(void** stream, const std::uint8_t* mem) {
  if (stream == nullptr)
    return RVX_STATUS_NULL_STREAM;
  if (mem == nullptr)
    return -2;
  stream_header* loaded = nullptr;
  const int status = read_image(mem, image_length(mem), &loaded);
  return load(stream, status, loaded);
}

int __rvxSaveStreamF(void* stream, const char* name, int length) {
  live_stream found;
  if (const int status = find_stream(stream, found); status != RVX_STATUS_OK)
    return status;
  return with_name(name, length,
                   [&](const char* path) { return save_image_file(*found.record, path); });
}

int __rvxLoadStreamF(void** stream, const char* name, int length) {
  if (stream == nullptr)
    return RVX_STATUS_NULL_STREAM;
  return with_name(name, length, [&](const char* path) {
    stream_header* loaded = nullptr;
    const int status = load_image_file(path, &loaded);
    return load(stream, status, loaded);
  });
}
