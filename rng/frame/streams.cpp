// SPDX-License-Identifier: Apache-2.0
// Statuses of the stream services turned into exceptions.
#include "frame/streams.hpp"

#include <kestrel/tarn/exceptions.hpp>

namespace kestrel::tarn::rng::detail {
namespace {

owned_stream require_made(rvx_stream stream, int status) {
  if (status != 0) {
    throw computation_error("rng", "engine initialization", "initialization failure");
  }
  return owned_stream(stream);
}

void require_moved(int status) {
  if (status != 0) {
    throw computation_error("rng", "skip_ahead", "");
  }
}

}  // namespace

owned_stream new_stream(std::int64_t code, std::uint64_t seed) {
  rvx_stream stream = nullptr;
  const int status = rvxNewStream(&stream, code, seed);
  return require_made(stream, status);
}

owned_stream new_stream(std::int64_t code, std::int64_t n, const std::uint32_t* seed) {
  rvx_stream stream = nullptr;
  const int status = rvxNewStreamEx(&stream, code, n, seed);
  return require_made(stream, status);
}

owned_stream copy_stream(rvx_stream source) {
  rvx_stream stream = nullptr;
  const int status = rvxCopyStream(&stream, source);
  return require_made(stream, status);
}

void skip_stream(rvx_stream stream, std::uint64_t words) {
  require_moved(rvxSkipAheadStream(stream, static_cast<std::int64_t>(words)));
}

void skip_stream(rvx_stream stream, std::int64_t digits, const std::uint64_t* words) {
  require_moved(rvxSkipAheadStreamEx(stream, digits, words));
}

}  // namespace kestrel::tarn::rng::detail
