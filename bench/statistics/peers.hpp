// SPDX-License-Identifier: Apache-2.0
// What a user would take instead: the same numbers of values from other generators, each in the
// plain loop that its manual shows.
#pragma once

#include <cstddef>
#include <cstdint>

namespace peers {

// Philox4x32-10 of Random123, a counter per block; reals by its own conversion to (0, 1].
void random123_words(std::uint64_t counter, std::size_t n, std::uint32_t* out);
void random123_floats(std::uint64_t counter, std::size_t n, float* out);
void random123_doubles(std::uint64_t counter, std::size_t n, double* out);

// std::mt19937 with std::uniform_real_distribution.
void std_words(std::size_t n, std::uint32_t* out);
void std_floats(std::size_t n, float* out);
void std_doubles(std::size_t n, double* out);

#if TARN_BENCH_BOOST
// boost::random::mt19937 with boost::random::uniform_real_distribution.
void boost_words(std::size_t n, std::uint32_t* out);
void boost_floats(std::size_t n, float* out);
void boost_doubles(std::size_t n, double* out);
#endif

}  // namespace peers
