// SPDX-License-Identifier: Apache-2.0
// The engine niederreiter: Niederreiter's sequence in base 2 (Bratley, Fox, Niederreiter, Algorithm
// 738, ACM TOMS 20, 1994) with the irreducible polynomials in the order of their numbers, or with
// those of the user.
#include <algorithm>

#include "distributions/real_words.hpp"
#include "engine.hpp"
#include "engines/digital_net.hpp"
#include "engines/niederreiter_directions.hpp"
#include "tarn_rvx.h"

namespace tarn::statistics {

namespace {

constexpr std::uint32_t table[] = {
#include "niederreiter_table.inc"
};
static_assert(sizeof table == niederreiter::table_dims * net::direction_words * sizeof *table);

// Seed words: none (1 dimension); the number of dimensions; or the number of dimensions, 1, 1,
// and an irreducible polynomial for each dimension.
constexpr std::size_t header_words = 3;
constexpr std::uint32_t user_header[] = {1, 1};

std::uint32_t dims_of(span<std::uint32_t> seed) {
  return seed.size == 0 ? 1 : seed.data[0];
}

std::size_t state_size(span<std::uint32_t> seed) {
  const std::uint32_t dims = dims_of(seed);
  if (seed.size <= 1)
    return dims <= niederreiter::table_dims ? net::state_size(dims) : bad_seed;
  const bool users = seed.size >= header_words && seed.data[1] == user_header[0] &&
                     seed.data[2] == user_header[1] && seed.size - header_words >= dims;
  if (!users)
    return bad_seed;
  const std::uint32_t* polynomials = seed.data + header_words;
  return std::all_of(polynomials, polynomials + dims, niederreiter::is_irreducible)
             ? net::state_size(dims)
             : bad_seed;
}

int seed(void* state, std::uint32_t, span<std::uint32_t> seed) {
  const std::uint32_t dims = dims_of(seed);
  std::uint32_t* directions = net::prepare(state, dims);
  if (seed.size <= 1) {
    std::copy_n(table, dims * net::direction_words, directions);
  } else {
    for (std::size_t d = 0; d < dims; ++d)
      niederreiter::direct(seed.data[header_words + d], directions + d * net::direction_words);
  }
  net::place_first_point(state);
  return RVX_STATUS_OK;
}

}  // namespace

extern const engine_ops niederreiter_engine;
constexpr engine_ops niederreiter_engine = {
    1,         1,       state_size, seed,  net::accepts,        net::remaining,
    net::skip, nullptr, net::fill,  false, &unsigned_word_rule,
};

}  // namespace tarn::statistics
