// SPDX-License-Identifier: Apache-2.0
// The recurrence applied to the record in the stream's memory, block by block.
#include "mt2203_skip.hpp"

#include "rng/engines/mt2203.hpp"
#include "rng/frame/streams.hpp"

namespace kestrel::tarn::rng::detail::openmp {
namespace {

using shape = mt2203_shape;

/// The block that follows. New words stand `order` places behind the old ones in the sequence: the
/// second loop reads what the first has made, the last word is joined with a new one.
void step(std::uint32_t (&words)[shape::order], std::uint32_t matrix) {
  constexpr std::uint32_t order = shape::order;
  constexpr std::uint32_t middle = shape::middle;
  for (std::uint32_t i = 0; i < order - middle; ++i) {
    words[i] = twisted<shape>(words[i], words[i + 1], words[i + middle], matrix);
  }
  for (std::uint32_t i = order - middle; i < order - 1; ++i) {
    words[i] = twisted<shape>(words[i], words[i + 1], words[i + middle - order], matrix);
  }
  words[order - 1] = twisted<shape>(words[order - 1], words[0], words[middle - 1], matrix);
}

}  // namespace

void skip_mt2203(rvx_stream stream, std::int64_t words) {
  if (words < 1) {
    return;
  }
  auto& record = *static_cast<mt2203_record*>(const_cast<void*>(state_record(stream)));
  std::uint64_t place = record.block.position % shape::order + static_cast<std::uint64_t>(words);
  for (; place >= shape::order; place -= shape::order) {
    step(record.block.words, record.constants.matrix);
  }
  // The statistics library writes a whole unread block as `order`, too.
  record.block.position = place == 0 ? shape::order : static_cast<std::uint32_t>(place);
}

}  // namespace kestrel::tarn::rng::detail::openmp
