// SPDX-License-Identifier: Apache-2.0
// What all raw generation routines share.
#pragma once

#include <cstddef>
#include <exception>

#include "blocks.hpp"
#include "raw_entries.hpp"
#include "statistics/common/parameters.hpp"
#include "stream.hpp"

namespace tarn::statistics {

// The common head of every routine: checks method, stream, count and results in this order and
// runs use(stream) if there is something to do. `methods` are the bits that the method may have;
// a negative method is always refused.
template <class Use>
int routine(int method, int methods, void* stream, int n, const void* r, const Use& use) {
  if (method < 0 || (method & ~methods) != 0)
    return -1;
  live_stream found;
  if (const int status = find_stream(stream, found); status != RVX_STATUS_OK)
    return status;
  if (n < 0)
    return -3;
  if (n == 0)
    return RVX_STATUS_OK;
  if (r == nullptr)
    return -4;
  try {
    return use(found);
  } catch (const sequence_ended&) {
    return RVX_STATUS_END_OF_SEQUENCE;
  } catch (const source_failed&) {
    return RVX_STATUS_NO_SOURCE;
  } catch (const std::exception&) {
    // Sharing out the work found no memory or no threads. The stream has not moved.
    return RVX_STATUS_NO_MEMORY;
  }
}

inline word_source source_of(const live_stream& stream) {
  return {stream.engine->ops, stream.state(), state_bytes(*stream.record)};
}

// Draws n values of `words_per_value` words each, unless the sequence ends before.
template <class Value, class Producer>
int draw_from(const live_stream& stream, int n, std::size_t words_per_value, Value* r,
              const Producer& producer) {
  const engine_ops& engine = *stream.engine->ops;
  const auto count = static_cast<std::size_t>(n);
  if (engine.remaining != nullptr && count * words_per_value > engine.remaining(stream.state()))
    return RVX_STATUS_END_OF_SEQUENCE;
  draw(source_of(stream), count, words_per_value, r, producer);
  return RVX_STATUS_OK;
}

}  // namespace tarn::statistics
