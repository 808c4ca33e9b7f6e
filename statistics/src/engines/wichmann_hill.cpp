// SPDX-License-Identifier: Apache-2.0
// The engines wichmann_hill: seeding, skipping and leapfrog by powers of the multipliers.
#include "engines/wichmann_hill.hpp"

#include <cstring>

#include "distributions/real_words.hpp"
#include "engine.hpp"
#include "tables/wichmann_hill_table.hpp"
#include "tarn_rvx.h"

namespace tarn::statistics {

namespace {

using wichmann_hill::components;
using wichmann_hill::product;

// The record as it stands in a stream. The multipliers start as the table has them; a leapfrog
// makes them powers of those.
struct wichmann_hill_state {
  std::uint32_t member;
  std::uint32_t state[components];  // whose word is next
  std::uint32_t multiplier[components];
};
static_assert(sizeof(wichmann_hill_state) == 36 && 36 <= max_parallel_state);

wichmann_hill_state load(const void* state) {
  wichmann_hill_state s;
  std::memcpy(&s, state, sizeof s);
  return s;
}

void store(const wichmann_hill_state& s, void* state) {
  std::memcpy(state, &s, sizeof s);
}

const std::uint32_t* moduli(std::uint32_t member) {
  return wichmann_hill_table[member].modulus;
}

// a^exponent mod p. The order of a divides p - 1.
std::uint32_t power(std::uint32_t a, std::uint64_t exponent, std::uint32_t p) {
  std::uint32_t result = 1;
  for (auto rest = static_cast<std::uint32_t>(exponent % (p - 1)); rest != 0; rest >>= 1) {
    if ((rest & 1) != 0)
      result = product(result, a, p);
    a = product(a, a, p);
  }
  return result;
}

// 2^64 / p, rounded to nearest. The prime p does not divide 2^64, so it goes into 2^64 - 1 as
// often.
std::uint64_t reciprocal(std::uint32_t p) {
  const std::uint64_t floor = ~std::uint64_t{0} / p;
  const std::uint64_t rest = 0 - floor * p;
  return floor + (rest > p / 2 ? 1 : 0);
}

std::size_t state_size(span<std::uint32_t>) {
  return sizeof(wichmann_hill_state);
}

// The words fill the four components, each modulo its prime. Missing ones are 1, and so is what
// would be 0, where a multiplicative generator stays for ever.
int seed(void* state, std::uint32_t member, span<std::uint32_t> words) {
  wichmann_hill_state s{member, {}, {}};
  for (std::size_t j = 0; j < components; ++j) {
    const std::uint32_t given = j < words.size ? words.data[j] % moduli(member)[j] : 1;
    s.state[j] = given != 0 ? given : 1;
    s.multiplier[j] = wichmann_hill_table[member].multiplier[j];
  }
  store(s, state);
  return RVX_STATUS_OK;
}

bool accepts(const void* state, std::size_t size, std::uint32_t member) {
  if (size != sizeof(wichmann_hill_state))
    return false;
  const wichmann_hill_state s = load(state);
  if (s.member != member)
    return false;
  for (int j = 0; j < components; ++j) {
    const std::uint32_t p = moduli(member)[j];
    if (s.state[j] == 0 || s.state[j] >= p || s.multiplier[j] == 0 || s.multiplier[j] >= p)
      return false;
  }
  return true;
}

void move(wichmann_hill_state& s, std::uint64_t distance) {
  for (int j = 0; j < components; ++j) {
    const std::uint32_t p = moduli(s.member)[j];
    s.state[j] = product(s.state[j], power(s.multiplier[j], distance, p), p);
  }
}

void skip(void* state, span<std::uint64_t> digits) {
  wichmann_hill_state s = load(state);
  move(s, digits.data[0]);
  store(s, state);
}

void leapfrog(void* state, std::uint32_t idx, std::uint32_t stride) {
  wichmann_hill_state s = load(state);
  move(s, idx);
  for (int j = 0; j < components; ++j)
    s.multiplier[j] = power(s.multiplier[j], stride, moduli(s.member)[j]);
  store(s, state);
}

void fill(void* state, std::uint32_t* out, std::size_t n) {
  if (n == 0)
    return;
  wichmann_hill_state s = load(state);
  wichmann_hill::generator g;
  for (int j = 0; j < components; ++j) {
    g.modulus[j] = moduli(s.member)[j];
    g.multiplier[j] = s.multiplier[j];
    g.reciprocal[j] = reciprocal(g.modulus[j]);
  }
  wichmann_hill::write_words(g, s.state, n, out);
  store(s, state);
}

}  // namespace

extern const engine_ops wichmann_hill_engine;
constexpr engine_ops wichmann_hill_engine = {
    wichmann_hill_members, 1, state_size, seed, accepts, nullptr, skip, leapfrog, fill, true,
    &unsigned_word_rule,
};

}  // namespace tarn::statistics
