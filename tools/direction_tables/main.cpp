// SPDX-License-Identifier: Apache-2.0
// Writes the default direction words of an engine to standard output, as rows of a C++ array: for
// each dimension v_1, ..., v_32 and a word 0.
//   direction_tables sobol | niederreiter
// The polynomials and initial numbers are published tables (Joe and Kuo 2008; Bratley, Fox and
// Niederreiter 1994), taken from where they are already installed, the headers of Boost.Random.
#include <cstdint>
#include <cstdio>
#include <cstring>

#include <boost/random/detail/niederreiter_base2_table.hpp>
#include <boost/random/detail/sobol_table.hpp>

#include "engines/niederreiter_directions.hpp"
#include "engines/sobol_directions.hpp"

namespace {

using boost::random::detail::qrng_tables::niederreiter_base2;
using sobol_numbers = boost::random::detail::qrng_tables::sobol;
using namespace tarn::statistics;

static_assert(sobol_numbers::max_dimension >= sobol::table_dims);
static_assert(niederreiter_base2::max_dimension >= niederreiter::table_dims);

// The published table begins with the second dimension. The first one is van der Corput's sequence,
// all of whose initial numbers are 1, as if its polynomial were 1.
void direct_sobol(std::uint32_t dim, std::uint32_t v[32]) {
  if (dim == 0) {
    for (unsigned j = 0; j < 32; ++j)
      v[j] = std::uint32_t{1} << (31 - j);
    return;
  }
  std::uint32_t initial[sobol_numbers::max_degree];
  for (unsigned j = 0; j < sobol_numbers::max_degree; ++j)
    initial[j] = sobol_numbers::minit(dim - 1, j);
  sobol::direct(sobol_numbers::polynomial(dim - 1), initial, v);
}

void direct_niederreiter(std::uint32_t dim, std::uint32_t v[32]) {
  niederreiter::direct(niederreiter_base2::polynomial(dim), v);
}

int write_table(std::uint32_t dims, void (*direct)(std::uint32_t dim, std::uint32_t v[32])) {
  for (std::uint32_t dim = 0; dim < dims; ++dim) {
    std::uint32_t v[32];
    direct(dim, v);
    for (const std::uint32_t word : v)
      std::printf("0x%x,", static_cast<unsigned>(word));
    std::puts("0,");
  }
  return std::fflush(stdout) == 0 && std::ferror(stdout) == 0 ? 0 : 1;
}

}  // namespace

int main(int argc, char** argv) {
  const char* engine = argc == 2 ? argv[1] : "";
  if (std::strcmp(engine, "sobol") == 0)
    return write_table(sobol::table_dims, direct_sobol);
  if (std::strcmp(engine, "niederreiter") == 0)
    return write_table(niederreiter::table_dims, direct_niederreiter);
  std::fputs("usage: direction_tables sobol | niederreiter\n", stderr);
  return 2;
}
