// SPDX-License-Identifier: Apache-2.0
// The engine mt2203: seeding, position and runs of words of each member of the family.
#include "engines/mt2203.hpp"

#include <cstddef>
#include <cstring>

#include "distributions/real_words.hpp"
#include "engine.hpp"
#include "engines/block_record.hpp"
#include "engines/block_seeding.hpp"
#include "tables/mt2203_table.hpp"
#include "tarn_rvx.h"

namespace tarn::statistics {

namespace {

constexpr std::size_t order = mt2203::shape::words;

// The record as it stands in a stream: untempered words, the position, and the member's constants.
// Clients read it there.
struct mt2203_state {
  block_record<order> block;
  twister_constants constants;
};
static_assert(sizeof(mt2203_state) == 292 && offsetof(mt2203_state, constants) == 280);

// The 27 bits of word 0 that belong to the state: the others reach no later word.
constexpr std::uint32_t upper = ~std::uint32_t{0} << mt2203::shape::lower_bits;

constexpr std::size_t run = 16;  // blocks: 4 KiB of words, and whole vectors

twister_constants constants_of(std::uint32_t member) {
  const mt2203_parameters& row = mt2203_table[member];
  return {row.matrix_a, row.mask_b, row.mask_c};
}

// A kernel with the constants of a state.
auto extend_by(const twister_constants& constants) {
  return [constants](std::uint32_t* words, std::size_t count) {
    mt2203::extend(constants, words, count);
  };
}

std::size_t state_size(span<std::uint32_t>) {
  return sizeof(mt2203_state);
}

int seed(void* state, std::uint32_t member, span<std::uint32_t> words) {
  auto& s = *static_cast<mt2203_state*>(state);
  s.constants = constants_of(member);
  std::uint32_t start[order];
  seed_block(words, start);
  begin_blocks(start, s.block, extend_by(s.constants));
  return RVX_STATUS_OK;
}

bool accepts(const void* state, std::size_t size, std::uint32_t member) {
  if (size != sizeof(mt2203_state) || !is_block_record<order>(state, upper))
    return false;
  const twister_constants expected = constants_of(member);
  return std::memcmp(static_cast<const char*>(state) + offsetof(mt2203_state, constants), &expected,
                     sizeof expected) == 0;
}

void fill(void* state, std::uint32_t* out, std::size_t n) {
  auto& s = *static_cast<mt2203_state*>(state);
  walk_blocks<run>(s.block, n, extend_by(s.constants),
                   [&out, &s](const std::uint32_t* words, std::size_t count) {
                     mt2203::temper(s.constants, words, count, out);
                     out += count;
                   });
}

}  // namespace

extern const engine_ops mt2203_engine;
constexpr engine_ops mt2203_engine = {
    mt2203_members, 1,     state_size,          seed, accepts, nullptr, nullptr, nullptr,
    fill,           false, &unsigned_word_rule,
};

}  // namespace tarn::statistics
