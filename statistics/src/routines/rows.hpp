// SPDX-License-Identifier: Apache-2.0
// Results of several values each, for raw routines of vectors and tables.
#pragma once

#include <cstddef>

#include "routines/routine.hpp"

namespace tarn::statistics {

// write(source, first, count) writes `count` results from number `first` on, `words` words each, on
// several threads where that pays.
template <class Write>
void draw_rows(const word_source& source, std::size_t n, std::size_t words, void* r,
               const Write& write) {
  if (words > piece_words) {
    write(source, 0, n);
    return;
  }
  // Counts results by an address that advances by one for each; none is as short as a byte.
  auto* const origin = static_cast<unsigned char*>(r);
  draw(source, n, words, origin,
       [&](const word_source& from, std::size_t count, unsigned char* to, bool) {
         write(from, static_cast<std::size_t>(to - origin), count);
       });
}

inline bool has_words(const live_stream& stream, std::size_t words) {
  const engine_ops& engine = *stream.engine->ops;
  return engine.remaining == nullptr || words <= engine.remaining(stream.state());
}

}  // namespace tarn::statistics
