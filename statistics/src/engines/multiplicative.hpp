// SPDX-License-Identifier: Apache-2.0
// What the multiplicative congruential engines share: x -> a x in the group of units modulo m. The
// state is the next word x and the multiplier a; a skip by k multiplies x by a^k, and a leapfrog
// by s leaves a^s as multiplier.
//
// A group is a class of
//   number                       of 32 or 64 bits; a word is written as its 32-bit parts
//   multiplier                   of a fresh stream
//   multiply(p, q)               the product of two members
//   contains(x)                  whether a number of a record is a member
//   start(seed)                  the first word for a seed of up to 64 bits
//   write_words(x, a, n, out)    n words from x on, with SIMD; returns the word behind them
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

#include "engine.hpp"
#include "tarn_rvx.h"

namespace tarn::statistics {

// n words from x on, one by one; returns the word behind them.
template <class Group, class Number>
Number write_one_by_one(Number x, Number a, std::size_t n, std::uint32_t* out) {
  for (; n != 0; --n, out += sizeof x / sizeof *out) {
    std::memcpy(out, &x, sizeof x);
    x = Group::multiply(x, a);
  }
  return x;
}

template <class Group>
class multiplicative_engine {
 public:
  static constexpr engine_ops table(const word_rule* rule) {
    return {1,          sizeof(number) / sizeof(std::uint32_t),
            state_size, seed,
            accepts,    nullptr,
            skip,       leapfrog,
            fill,       true,
            rule};
  }

 private:
  using number = typename Group::number;

  // The record as it stands in a stream; clients read it there.
  struct record {
    number x;  // the next word
    number a;
  };

  // Fewer words than this take less time one by one than the preparation of the lanes does.
  static constexpr std::size_t few_words = 12;

  static record load(const void* state) {
    record r;
    std::memcpy(&r, state, sizeof r);
    return r;
  }

  static void store(const record& r, void* state) { std::memcpy(state, &r, sizeof r); }

  static number power(number base, std::uint64_t exponent) {
    number result = 1;
    for (; exponent != 0; exponent >>= 1) {
      if ((exponent & 1) != 0)
        result = Group::multiply(result, base);
      base = Group::multiply(base, base);
    }
    return result;
  }

  static std::size_t state_size(span<std::uint32_t>) { return sizeof(record); }

  static int seed(void* state, std::uint32_t, span<std::uint32_t> given) {
    std::uint32_t words[2] = {given.size == 0 ? 1u : 0u, 0};
    std::copy_n(given.data, std::min<std::size_t>(given.size, 2), words);
    store({Group::start(words[0] | std::uint64_t{words[1]} << 32), Group::multiplier}, state);
    return RVX_STATUS_OK;
  }

  static bool accepts(const void* state, std::size_t size, std::uint32_t) {
    if (size != sizeof(record))
      return false;
    const record r = load(state);
    return Group::contains(r.x) && Group::contains(r.a);
  }

  static void skip(void* state, span<std::uint64_t> digits) {
    record r = load(state);
    r.x = Group::multiply(r.x, power(r.a, digits.data[0]));
    store(r, state);
  }

  static void leapfrog(void* state, std::uint32_t idx, std::uint32_t stride) {
    record r = load(state);
    r.x = Group::multiply(r.x, power(r.a, idx));
    r.a = power(r.a, stride);
    store(r, state);
  }

  static void fill(void* state, std::uint32_t* out, std::size_t n) {
    record r = load(state);
    r.x = n < few_words ? write_one_by_one<Group>(r.x, r.a, n, out)
                        : Group::write_words(r.x, r.a, n, out);
    store(r, state);
  }
};

}  // namespace tarn::statistics
