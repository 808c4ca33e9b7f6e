// SPDX-License-Identifier: Apache-2.0
// The raw routines of bits and uniform_bits.
#include "distributions/raw_words.hpp"
#include "routines/routine.hpp"

namespace {

using namespace tarn::statistics;

template <class Value>
int uniform_bits(int method, void* stream, int n, Value* r) {
  return routine(method, parameters::any_method, stream, n, r, [&](const live_stream& s) {
    if (!s.engine->uniform_bits)
      return RVX_STATUS_UNSUPPORTED;
    constexpr std::size_t words_per_value = sizeof(Value) / sizeof(std::uint32_t);
    if (s.engine->ops->word_parts == 2)
      return draw_from(s, n, words_per_value, r, upper_bits<Value>{s.engine->word_bits - 32});
    return draw_from(s, n, words_per_value, r, raw_words<Value>{});
  });
}

}  // namespace

int _rvxiRngUniformBits(int method, void* stream, int n, std::uint32_t* r) {
  return routine(method, parameters::any_method, stream, n, r, [&](const live_stream& s) {
    if (s.engine->ops->word_parts == 2)
      return draw_from(s, n, 1, reinterpret_cast<two_parts*>(r), raw_words<two_parts>{});
    return draw_from(s, n, 1, r, raw_words<std::uint32_t>{});
  });
}

int _rvxiRngUniformBits32(int method, void* stream, int n, std::uint32_t* r) {
  return uniform_bits(method, stream, n, r);
}

int _rvxiRngUniformBits64(int method, void* stream, int n, std::uint64_t* r) {
  return uniform_bits(method, stream, n, r);
}
