// SPDX-License-Identifier: Apache-2.0
// The engine philox4x32x10: Philox in the frame of the counter-based engines.
#include "engines/philox4x32x10.hpp"

#include <algorithm>

#include "distributions/real_words.hpp"
#include "engines/counter_engine.hpp"

namespace tarn::statistics {

namespace {

struct philox_kernel {
  static constexpr std::size_t key_words = 2;

  static void evaluate(const std::uint32_t* key, const std::uint32_t* ctr, std::uint32_t* out) {
    const philox::block b = philox::evaluate({{ctr[0], ctr[1], ctr[2], ctr[3]}}, key[0], key[1]);
    std::copy_n(b.word, 4, out);
  }

  static void write_blocks(const std::uint32_t* key, const std::uint32_t* ctr, std::size_t count,
                           std::uint32_t* out) {
    philox::write_blocks(key, ctr, count, out);
  }
};

}  // namespace

extern const engine_ops philox4x32x10_engine;
constexpr engine_ops philox4x32x10_engine = counter_engine<philox_kernel>::table(&signed_word_rule);

}  // namespace tarn::statistics
