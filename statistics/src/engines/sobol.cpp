// SPDX-License-Identifier: Apache-2.0
// The engine sobol: Sobol's sequence with the direction numbers of Joe and Kuo (Constructing Sobol
// Sequences with Better Two-Dimensional Projections, SIAM J. Sci. Comput. 30, 2008), or with those
// of the user.
#include <algorithm>

#include "distributions/real_words.hpp"
#include "engine.hpp"
#include "engines/digital_net.hpp"
#include "engines/sobol_directions.hpp"
#include "tarn_rvx.h"

namespace tarn::statistics {

namespace {

constexpr std::uint32_t table[] = {
#include "sobol_table.inc"
};
static_assert(sizeof table == sobol::table_dims * net::direction_words * sizeof *table);

// Seed words: none (1 dimension); the number of dimensions; or the number of dimensions, 1, 4,
// and 32 direction words for each dimension, most significant first.
constexpr std::size_t header_words = 3;
constexpr std::uint32_t user_header[] = {1, 4};
constexpr std::size_t user_words = 32;  // of a dimension

std::uint32_t dims_of(span<std::uint32_t> seed) {
  return seed.size == 0 ? 1 : seed.data[0];
}

std::size_t state_size(span<std::uint32_t> seed) {
  const std::uint32_t dims = dims_of(seed);
  if (seed.size <= 1)
    return dims <= sobol::table_dims ? net::state_size(dims) : bad_seed;
  const bool users = seed.size >= header_words && seed.data[1] == user_header[0] &&
                     seed.data[2] == user_header[1] &&
                     (seed.size - header_words) / user_words >= dims;
  return users ? net::state_size(dims) : bad_seed;
}

int seed(void* state, std::uint32_t, span<std::uint32_t> seed) {
  const std::uint32_t dims = dims_of(seed);
  std::uint32_t* directions = net::prepare(state, dims);
  if (seed.size <= 1) {
    std::copy_n(table, dims * net::direction_words, directions);
  } else {
    for (std::size_t d = 0; d < dims; ++d)
      std::copy_n(seed.data + header_words + d * user_words, user_words,
                  directions + d * net::direction_words);
  }
  net::place_first_point(state);
  return RVX_STATUS_OK;
}

}  // namespace

extern const engine_ops sobol_engine;
constexpr engine_ops sobol_engine = {
    1,         1,       state_size, seed,  net::accepts,        net::remaining,
    net::skip, nullptr, net::fill,  false, &unsigned_word_rule,
};

}  // namespace tarn::statistics
