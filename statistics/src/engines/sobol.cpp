// SPDX-License-Identifier: Apache-2.0
// The engine sobol: Sobol's sequence with the direction numbers of Joe and Kuo (Constructing Sobol
// Sequences with Better Two-Dimensional Projections, SIAM J. Sci. Comput. 30, 2008), or with those
// of the user.
#include <algorithm>

#include "distributions/real_words.hpp"
#include "engine.hpp"
#include "engines/digital_net.hpp"
#include "engines/sobol_directions.hpp"

namespace tarn::statistics {

namespace {

constexpr std::uint32_t table[] = {
#include "sobol_table.inc"
};
static_assert(sizeof table == sobol::table_dims * net::direction_words * sizeof *table);

// The user's words are the direction words, most significant first.
constexpr std::size_t user_words = 32;
constexpr net::seed_form form{table, sobol::table_dims, 4, user_words};

std::size_t state_size(span<std::uint32_t> seed) {
  return net::state_size(form, seed);
}

int seed(void* state, std::uint32_t, span<std::uint32_t> words) {
  return net::seed_state(state, form, words,
                         [](const std::uint32_t* users, std::uint32_t* directions) {
                           std::copy_n(users, user_words, directions);
                         });
}

}  // namespace

extern const engine_ops sobol_engine;
constexpr engine_ops sobol_engine = {
    1,         1,       state_size, seed,  net::accepts,        net::remaining,
    net::skip, nullptr, net::fill,  false, &unsigned_word_rule,
};

}  // namespace tarn::statistics
