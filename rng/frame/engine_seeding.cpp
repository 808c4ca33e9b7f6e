// SPDX-License-Identifier: Apache-2.0
// Lists of 64-bit seeds as the words that streams take.
#include "frame/engine_seeding.hpp"

namespace kestrel::tarn::rng::detail {

std::vector<std::uint32_t> words_of(std::initializer_list<std::uint64_t> list) {
  std::vector<std::uint32_t> words;
  words.reserve(2 * list.size());
  for (const std::uint64_t item : list) {
    words.push_back(static_cast<std::uint32_t>(item));
    words.push_back(static_cast<std::uint32_t>(item >> 32));
  }
  return words;
}

}  // namespace kestrel::tarn::rng::detail
