// SPDX-License-Identifier: Apache-2.0
// Streams of the statistics library as the frame uses them: every engine owns one, on every
// device. Failures become the exceptions of the public surface.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <memory>
#include <tarn_rvx.h>

namespace kestrel::tarn::rng::detail {

/// A failure to delete has nobody to be told to.
struct stream_deleter {
  void operator()(rvx_stream stream) const { rvxDeleteStream(&stream); }
};
using owned_stream = std::unique_ptr<void, stream_deleter>;

/// New streams; raise computation_error ("engine initialization").
owned_stream new_stream(std::int64_t code, std::uint64_t seed);
owned_stream new_stream(std::int64_t code, std::int64_t n, const std::uint32_t* seed);
owned_stream copy_stream(rvx_stream source);

/// The stream code of a member of a set of engines; raises invalid_argument past its end.
std::int64_t member_code(std::int64_t code, std::uint32_t engine_idx, std::uint32_t members);

/// Move a stream by `words`, or by the number whose 64-bit digits are given, least significant
/// first; raise computation_error ("skip_ahead").
void skip_stream(rvx_stream stream, std::uint64_t words);
void skip_stream(rvx_stream stream, std::initializer_list<std::uint64_t> digits);

/// Leaves a stream every `stride`-th word from word `idx` on; raises computation_error
/// ("leapfrog").
void leapfrog_stream(rvx_stream stream, std::uint64_t idx, std::uint64_t stride);

/// The engine's state record inside the stream's memory.
inline const void* state_record(rvx_stream stream) {
  return static_cast<const unsigned char*>(stream) + 16;
}

}  // namespace kestrel::tarn::rng::detail
