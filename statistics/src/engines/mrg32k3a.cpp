// SPDX-License-Identifier: Apache-2.0
// The engine mrg32k3a: seeding, position and runs of words.
#include "engines/mrg32k3a.hpp"

#include <algorithm>
#include <cstring>

#include "distributions/real_words.hpp"
#include "engine.hpp"
#include "tarn_rvx.h"

namespace tarn::statistics {

namespace {

using namespace mrg32k3a;

// The powers of the transition matrix by d 8^level, d = 1..7. A 64-bit count has 22 digits to the
// base 8, so that a jump by it is at most 22 products of a matrix and a vector.
constexpr int digit_bits = 3;
constexpr int levels = 22;
struct jump_table {
  matrix power[levels][8];
};

constexpr jump_table make_jumps() {
  jump_table jumps{};
  matrix base = transition;  // to the power 8^level
  for (auto& level : jumps.power) {
    level[1] = base;
    for (int d = 2; d < 8; ++d)
      level[d] = level[d - 1] * base;
    base = level[7] * base;
  }
  return jumps;
}

constexpr jump_table jumps = make_jumps();

// The power by 2^64, the unit of the second digit of a long count: 2 * 8^21.
constexpr const matrix& jump_2_64 = jumps.power[21][2];

state jump(state s, std::uint64_t count) {
  for (int level = 0; count != 0; ++level, count >>= digit_bits) {
    if (const std::uint64_t d = count & 7; d != 0)
      s = jumps.power[level][d] * s;
  }
  return s;
}

bool all_zero(const std::uint32_t v[3]) {
  return (v[0] | v[1] | v[2]) == 0;
}

state load(const void* record) {
  state s;
  std::memcpy(&s, record, sizeof s);
  return s;
}

void store(const state& s, void* record) {
  std::memcpy(record, &s, sizeof s);
}

std::size_t state_size(span<std::uint32_t>) {
  return sizeof(state);
}

int seed(void* record, std::uint32_t, span<std::uint32_t> words) {
  const auto word = [words](std::size_t i) { return i < words.size ? words.data[i] : 1u; };
  state s{{word(0) % m1, word(1) % m1, word(2) % m1}, {word(3) % m2, word(4) % m2, word(5) % m2}};
  // From three zeros a recurrence would never come away.
  if (all_zero(s.x))
    s.x[0] = 1;
  if (all_zero(s.y))
    s.y[0] = 1;
  store(s, record);
  return RVX_STATUS_OK;
}

bool accepts(const void* record, std::size_t size, std::uint32_t) {
  if (size != sizeof(state))
    return false;
  const state s = load(record);
  return std::max({s.x[0], s.x[1], s.x[2]}) < m1 && std::max({s.y[0], s.y[1], s.y[2]}) < m2 &&
         !all_zero(s.x) && !all_zero(s.y);
}

void skip(void* record, span<std::uint64_t> digits) {
  if (digits.size == 0)
    return;
  state s = jump(load(record), digits.data[0]);
  std::size_t size = digits.size;
  while (size > 1 && digits.data[size - 1] == 0)
    --size;
  matrix power = jump_2_64;
  for (std::size_t i = 1; i < size; ++i) {
    for (int bit = 0; bit < 64; ++bit) {
      if ((digits.data[i] >> bit & 1) != 0)
        s = power * s;
      power = power * power;
    }
  }
  store(s, record);
}

// Up to this many words take less time one by one than a whole round and a jump do.
constexpr std::size_t few_words = 64;

void fill(void* record, std::uint32_t* out, std::size_t n) {
  state s = load(record);
  for (; n >= round_words; n -= round_words, out += round_words) {
    write_round(s, out);
    s = jump(s, round_words);
  }
  if (n > few_words) {
    std::uint32_t round[round_words];
    write_round(s, round);
    std::copy_n(round, n, out);
    s = jump(s, n);
  } else {
    for (std::size_t i = 0; i < n; ++i)
      out[i] = next(s);
  }
  store(s, record);
}

}  // namespace

extern const engine_ops mrg32k3a_engine;
constexpr engine_ops mrg32k3a_engine = {
    1, 1, state_size, seed, accepts, nullptr, skip, nullptr, fill, true, &mrg32k3a_word_rule,
};

}  // namespace tarn::statistics
