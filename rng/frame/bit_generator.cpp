// SPDX-License-Identifier: Apache-2.0
// Blocks of words, for all engines at once.
#include "frame/bit_generator.hpp"

#include <utility>

namespace kestrel::tarn::rng::detail {

void fill_block(read_ahead& ahead, rvx_stream stream) {
  if (ahead.size > 1) {  // a block of one word is never given back
    ahead.start = copy_stream(stream);
  }
  if (ahead.draw(RVX_RNG_METHOD_STANDARD, stream, ahead.size, ahead.words.data()) != 0) {
    throw computation_error("rng", "bit_generator", "words could not be drawn");
  }
}

// The status says nothing: what has been drawn once can be drawn again, except from an outer
// source, which has no place to come back to.
void give_back(read_ahead& ahead, owned_stream& stream, std::int64_t used) noexcept {
  stream = std::move(ahead.start);
  ahead.draw(RVX_RNG_METHOD_STANDARD, stream.get(), used, ahead.words.data());
}

}  // namespace kestrel::tarn::rng::detail
