// SPDX-License-Identifier: Apache-2.0
// Canonical reals: what the formula of a distribution starts from. The words of an engine as reals
// of [lo, hi) by the engine's rule, one word each, in blocks that stay in the nearest cache.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <type_traits>
#include <vector>

#include "blocks.hpp"
#include "distributions/real_words.hpp"
#include "engine.hpp"

namespace tarn::statistics {

template <class Real>
class canonical {
 public:
  canonical(const word_source& source, Real lo, Real hi) : rule_(*source.engine->rule) {
    if constexpr (std::is_same_v<Real, float>)
      map_ = rule_.float_map(lo, hi);
    else
      map_ = rule_.double_map(lo, hi);
  }

  // The next n reals of the source.
  void draw(const word_source& source, std::size_t n, Real* out) const {
    alignas(64) std::uint32_t words[block_words];
    const std::size_t block = block_words / source.engine->word_parts;
    while (n != 0) {
      const std::size_t count = std::min(n, block);
      source.fill(words, count);
      turn(words, count, out);
      out += count;
      n -= count;
    }
  }

  // The next real of the source, which stays where it is; lo at the end of a finite sequence.
  Real peek(const word_source& source) const {
    alignas(16) std::uint32_t word[2] = {0, 0};
    if (source.engine->remaining == nullptr || source.engine->remaining(source.state) != 0) {
      const auto* state = static_cast<const unsigned char*>(source.state);
      std::vector<unsigned char> copy(state, state + source.state_bytes);
      source.engine->fill(copy.data(), word, 1);
    }
    Real real;
    turn(word, 1, &real);
    return real;
  }

  // The reals that words drawn elsewhere mean.
  void turn(const std::uint32_t* words, std::size_t n, Real* out) const {
    const finish<Real> as_it_is{};
    if constexpr (std::is_same_v<Real, float>)
      rule_.to_float(words, n, map_, as_it_is, out);
    else
      rule_.to_double(words, n, map_, as_it_is, out);
  }

 private:
  const word_rule& rule_;
  affine<Real> map_;
};

}  // namespace tarn::statistics
