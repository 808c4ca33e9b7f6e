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

  // n words to n numbers.
  void (*to_float)(const std::uint32_t* words, std::size_t n, affine<float> map,
                   const finish<float>& end, float* out);
  void (*to_double)(const std::uint32_t* words, std::size_t n, affine<double> map,
                    const finish<double>& end, double* out);
};

// Words read as signed 32-bit numbers around the middle of the range: philox4x32x10.
extern const word_rule signed_word_rule;

// The kernels behind the rule.
void signed_words_to_float(const std::uint32_t* words, std::size_t n, affine<float> map,
                           const finish<float>& end, float* out);
void signed_words_to_double(const std::uint32_t* words, std::size_t n, affine<double> map,
                            const finish<double>& end, double* out);

// floor(x) of each number, numbers outside the range of the result giving its nearest end.
void floor_to_int32(const float* x, std::size_t n, bool streaming, std::int32_t* out);

// Orders streaming stores before what this thread writes next.
void flush_streaming();

}  // namespace tarn::statistics
