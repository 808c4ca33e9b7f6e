// SPDX-License-Identifier: Apache-2.0
// The engine nondeterministic: words of a source outside. A stream has no state, takes no seed,
// cannot be repeated, and ends with source_failed when the source does.
#include "engines/nondeterministic.hpp"

#include "distributions/real_words.hpp"
#include "engine.hpp"
#include "tarn_rvx.h"

namespace tarn::statistics {

namespace {

std::size_t state_size(span<std::uint32_t>) {
  return 0;
}

int seed(void*, std::uint32_t, span<std::uint32_t>) {
  return nondeterministic::chosen_source() == nullptr ? RVX_STATUS_NO_SOURCE : RVX_STATUS_OK;
}

bool accepts(const void*, std::size_t size, std::uint32_t) {
  return size == 0;
}

void fill(void*, std::uint32_t* out, std::size_t n) {
  const nondeterministic::entropy_source* source = nondeterministic::chosen_source();
  if (source == nullptr || !source->draw(out, n))
    throw source_failed();
}

}  // namespace

extern const engine_ops nondeterministic_engine;
constexpr engine_ops nondeterministic_engine = {
    1, 1, state_size, seed, accepts, nullptr, nullptr, nullptr, fill, false, &unsigned_word_rule,
};

}  // namespace tarn::statistics
