// SPDX-License-Identifier: Apache-2.0
// What a user would take instead of each engine: n words (or n values, where a peer gives doubles)
// in the plain loop that its manual shows.
#pragma once

#include <cstddef>
#include <cstdint>

namespace peers {

// Random123: a counter per block of four; n is a multiple of four.
void random123_philox(std::size_t n, std::uint32_t* out);
// ARS of five rounds, with the processor's AES instructions.
void random123_ars5(std::size_t n, std::uint32_t* out);

void std_mt19937(std::size_t n, std::uint32_t* out);

// The GNU Scientific Library.
void gsl_r250(std::size_t n, std::uint32_t* out);
void gsl_cmrg(std::size_t n, std::uint32_t* out);
// Points of 12 coordinates; n is a multiple of 12.
void gsl_niederreiter_12(std::size_t n, double* out);

// Boost.Random, 40 dimensions.
void boost_sobol_40(std::size_t n, std::uint32_t* out);

}  // namespace peers
