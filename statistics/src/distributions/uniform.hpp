// SPDX-License-Identifier: Apache-2.0
// Uniform variates: producers for blocks.hpp.
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

}  // namespace tarn::statistics
