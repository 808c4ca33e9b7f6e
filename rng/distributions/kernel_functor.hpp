// SPDX-License-Identifier: Apache-2.0
// What a kernel needs to know of a distribution. A functor is a plain record that travels to the
// kernel by value and turns four values that the engine delivers into results:
//   source             float, double or std::uint32_t: the type of what the engine delivers
//   asks               whether that is reals, words or equidistributed words
//   results            results of four delivered values: 4, or 2 where each takes two words
//   range()            where it asks for reals, the canonical range that they come from
//   operator()(four)   the results
// Besides that, or instead of it:
//   one(u)             where each value gives a result by itself
//   pair(u0, u1, out)  where two values make pair_results results together
//   whole              true where all four make the results together
//   at(u, index)       instead of operator(), where a value's result depends on its place in the
//                      call as well; the index may lie past the last result, which is then dropped
#pragma once

#include <cstdint>
#include <type_traits>

namespace kestrel::tarn::rng::detail::gpu {

/// What an engine delivers: reals of a range by its word-to-real rule, its words as they are, or 32
/// equidistributed bits.
enum class drawn : std::uint8_t { reals, words, bits };

/// Reals of [lo, hi).
template <typename Real>
struct real_range {
  Real lo;
  Real hi;
};

template <typename Functor, typename = void>
inline constexpr bool has_one = false;
template <typename Functor>
inline constexpr bool has_one<Functor, std::void_t<decltype(&Functor::one)>> = true;

template <typename Functor, typename = void>
inline constexpr bool has_pair = false;
template <typename Functor>
inline constexpr bool has_pair<Functor, std::void_t<decltype(Functor::pair_results)>> = true;

template <typename Functor, typename = void>
inline constexpr bool is_whole = false;
template <typename Functor>
inline constexpr bool is_whole<Functor, std::void_t<decltype(Functor::whole)>> = true;

template <typename Functor, typename = void>
inline constexpr bool has_place = false;
template <typename Functor>
inline constexpr bool has_place<Functor, std::void_t<decltype(&Functor::at)>> = true;

/// Values that a functor has to be given together, and what it makes of them. 64-bit results of two
/// words stand in pairs without a function for a pair.
template <typename Functor>
inline constexpr int values_together = is_whole<Functor>                            ? 4
                                       : has_pair<Functor> || Functor::results == 2 ? 2
                                                                                    : 1;
template <typename Functor>
inline constexpr int results_together = Functor::results* values_together<Functor> / 4;

/// Words of the sequence that one result takes.
template <typename Functor>
inline constexpr std::uint64_t words_per_result = 4 / Functor::results;

}  // namespace kestrel::tarn::rng::detail::gpu
