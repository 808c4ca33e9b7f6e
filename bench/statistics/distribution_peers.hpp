// SPDX-License-Identifier: Apache-2.0
// What a user would draw each distribution with instead, in the plain loop that each manual shows.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "../comparisons.hpp"

namespace peers {

using fill_floats = void (*)(std::size_t n, float* out);
using fill_doubles = void (*)(std::size_t n, double* out);
using fill_integers = void (*)(std::size_t n, std::int32_t* out);

template <class Fill>
struct peer {
  const char* name;
  Fill fill;
};

extern const std::vector<peer<fill_floats>> float_peers;
extern const std::vector<peer<fill_doubles>> double_peers;
extern const std::vector<peer<fill_integers>> integer_peers;
// Those of the plot in the README.
extern const std::vector<peer<fill_doubles>> speed_peers;

// Rates of NumPy, measured by the Python that is on the path, or none.
std::vector<foreign_rate> numpy_rates();

}  // namespace peers
