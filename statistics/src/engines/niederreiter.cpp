// SPDX-License-Identifier: Apache-2.0
// The engine niederreiter: Niederreiter's sequence in base 2 (Bratley, Fox, Niederreiter, Algorithm
// 738, ACM TOMS 20, 1994) with the irreducible polynomials in the order of their numbers, or with
// those of the user.
#include <algorithm>

#include "distributions/real_words.hpp"
#include "engine.hpp"
#include "engines/digital_net.hpp"
#include "engines/niederreiter_directions.hpp"

namespace tarn::statistics {

namespace {

constexpr std::uint32_t table[] = {
#include "niederreiter_table.inc"
};
static_assert(sizeof table == niederreiter::table_dims * net::direction_words * sizeof *table);

// The user's word is an irreducible polynomial.
constexpr net::seed_form form{table, niederreiter::table_dims, 1, 1};

std::size_t state_size(span<std::uint32_t> seed) {
  const std::size_t size = net::state_size(form, seed);
  const std::uint32_t* polynomials = net::users_words(seed);
  if (size == bad_seed || polynomials == nullptr)
    return size;
  return std::all_of(polynomials, polynomials + seed.data[0], niederreiter::is_irreducible)
             ? size
             : bad_seed;
}

int seed(void* state, std::uint32_t, span<std::uint32_t> words) {
  return net::seed_state(state, form, words,
                         [](const std::uint32_t* polynomial, std::uint32_t* directions) {
                           niederreiter::direct(*polynomial, directions);
                         });
}

}  // namespace

extern const engine_ops niederreiter_engine;
constexpr engine_ops niederreiter_engine = {
    1,         1,       state_size, seed,  net::accepts,        net::remaining,
    net::skip, nullptr, net::fill,  false, &unsigned_word_rule,
};

}  // namespace tarn::statistics
