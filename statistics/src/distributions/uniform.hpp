// SPDX-License-Identifier: Apache-2.0
// Uniform variates and raw words: producers for blocks.hpp.
#pragma once

#include <cstddef>
#include <cstdint>

#include "blocks.hpp"
#include "distributions/real_words.hpp"

namespace tarn::statistics {

// Reals of [a, b), one word each; `accurate` keeps rounding from leaving [a, b].
template <class Real>
struct uniform_real {
  Real a, b;
  bool accurate;

  void operator()(const word_source& source, std::size_t n, Real* out, bool streaming) const {
    const word_rule& rule = *source.engine->rule;
    const finish<Real> end{accurate, a, b, streaming};
    if constexpr (sizeof(Real) == sizeof(float)) {
      const affine<float> map = rule.float_map(a, b);
      turn_blocks(source, n, out, streaming,
                  [&](const std::uint32_t* words, std::size_t count, float* to) {
                    rule.to_float(words, count, map, end, to);
                  });
    } else {
      const affine<double> map = rule.double_map(a, b);
      turn_blocks(source, n, out, streaming,
                  [&](const std::uint32_t* words, std::size_t count, double* to) {
                    rule.to_double(words, count, map, end, to);
                  });
    }
  }
};

// Integers of [a, b): floor of the float uniform over the bounds rounded to float.
struct uniform_int32 {
  std::int32_t a, b;

  void operator()(const word_source& source, std::size_t n, std::int32_t* out,
                  bool streaming) const {
    const word_rule& rule = *source.engine->rule;
    const affine<float> map = rule.float_map(static_cast<float>(a), static_cast<float>(b));
    const finish<float> end{};
    turn_blocks(source, n, out, streaming,
                [&](const std::uint32_t* words, std::size_t count, std::int32_t* to) {
                  alignas(64) float reals[block_words];
                  rule.to_float(words, count, map, end, reals);
                  floor_to_int32(reals, count, streaming, to);
                });
  }
};

// The engine's words as they are, of 32 bits or two to a value, the first in the low half. They go
// straight into the results: a detour through a block for the sake of streaming stores costs more
// than it saves (measured for 100 million words: 4.7 against 6.1 thousand million a second on one
// thread, 8.0 against 7.7 on two).
template <class Value>
struct raw_words {
  static constexpr std::size_t words_per_value = sizeof(Value) / sizeof(std::uint32_t);

  void operator()(const word_source& source, std::size_t n, Value* out, bool) const {
    source.fill(reinterpret_cast<std::uint32_t*>(out), n * words_per_value);
  }
};

static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__, "values are written word by word");

}  // namespace tarn::statistics
