// SPDX-License-Identifier: Apache-2.0
// Statuses of the stream services turned into exceptions.
#include "frame/streams.hpp"

#include <string>

#include <kestrel/tarn/exceptions.hpp>

namespace kestrel::tarn::rng::detail {
namespace {

owned_stream require_made(rvx_stream stream, int status) {
  if (status != 0) {
    throw computation_error("rng", "engine initialization", "initialization failure");
  }
  return owned_stream(stream);
}

void require_moved(int status, const char* function) {
  if (status != 0) {
    throw computation_error("rng", function, "");
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

// Both sets say "mt2203": callers compare the message as text.
std::int64_t member_code(std::int64_t code, std::uint32_t engine_idx, std::uint32_t members) {
  if (engine_idx >= members) {
    throw invalid_argument("rng", "mt2203",
                           "engine_idx is out of range [0, " + std::to_string(members) + ")");
  }
  return code | engine_idx;
}

void skip_stream(rvx_stream stream, std::uint64_t words) {
  require_moved(rvxSkipAheadStream(stream, static_cast<std::int64_t>(words)), "skip_ahead");
}

void skip_stream(rvx_stream stream, std::initializer_list<std::uint64_t> digits) {
  require_moved(
      rvxSkipAheadStreamEx(stream, static_cast<std::int64_t>(digits.size()), digits.begin()),
      "skip_ahead");
}

void leapfrog_stream(rvx_stream stream, std::uint64_t idx, std::uint64_t stride) {
  require_moved(
      rvxLeapfrogStream(stream, static_cast<std::int64_t>(idx), static_cast<std::int64_t>(stride)),
      "leapfrog");
}

}  // namespace kestrel::tarn::rng::detail
