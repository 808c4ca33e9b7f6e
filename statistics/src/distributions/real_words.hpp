// SPDX-License-Identifier: Apache-2.0
// How the words of an engine become real numbers: one fused multiply-add, x = word * scale +
// offset. Engines whose words are read alike share a rule; distributions know the rule only.
// Fused means one rounding in every SIMD target, also where the hardware has no such instruction.
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics {

template <class Real>
struct affine {
  Real scale, offset;
};

// What to do with the result of the multiply-add, and how to store it.
template <class Real>
struct finish {
  bool clamp;  // to [low, high]: min(max(x, low), high)
  Real low, high;
  bool streaming;  // store around the caches where the alignment allows
};

struct word_rule {
  // The map that carries the words onto [lo, hi), computed in the type of the result.
  affine<float> (*float_map)(float lo, float hi);
  affine<double> (*double_map)(double lo, double hi);

  // n words to n numbers. Words of two parts are aligned to their 8 bytes.
  void (*to_float)(const std::uint32_t* words, std::size_t n, affine<float> map,
                   const finish<float>& end, float* out);
  void (*to_double)(const std::uint32_t* words, std::size_t n, affine<double> map,
                    const finish<double>& end, double* out);
};

// Words read as signed 32-bit numbers around the middle of the range: philox4x32x10.
extern const word_rule signed_word_rule;
// Words read as 32-bit fractions: most engines.
extern const word_rule unsigned_word_rule;
// Words divided by the modulus of the engine, in float by its nearest float: mrg32k3a.
extern const word_rule mrg32k3a_word_rule;
// Words divided by 2^31 - 1, in float by 2^31: mcg31m1.
extern const word_rule mcg31m1_word_rule;
// Words of 59 bits in two parts, read as fractions: mcg59.
extern const word_rule mcg59_word_rule;

// The kernels behind the rules: words read as signed, as unsigned, and of two parts as unsigned
// numbers below 2^wide_word_bits, each rounded once to the type of the results.
inline constexpr int wide_word_bits = 59;
using words_to_float = void(const std::uint32_t* words, std::size_t n, affine<float> map,
                            const finish<float>& end, float* out);
using words_to_double = void(const std::uint32_t* words, std::size_t n, affine<double> map,
                             const finish<double>& end, double* out);
words_to_float signed_words_to_float, unsigned_words_to_float, wide_words_to_float;
words_to_double signed_words_to_double, unsigned_words_to_double, wide_words_to_double;

// floor(x) of each number, numbers outside the range of the result giving its nearest end.
void floor_to_int32(const float* x, std::size_t n, bool streaming, std::int32_t* out);

// Orders streaming stores before what this thread writes next.
void flush_streaming();

}  // namespace tarn::statistics
