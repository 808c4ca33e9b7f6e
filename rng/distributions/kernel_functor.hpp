// SPDX-License-Identifier: Apache-2.0
// What a kernel needs to know of a distribution. A functor is a plain record that travels to the
// kernel by value and turns four values that the engine delivers into results:
//   source             float, double or std::uint32_t: the type of what the engine delivers
//   asks               whether that is reals, words or equidistributed words
//   results            results of four delivered values: 4, or 2 where each takes two words
//   range()            where it asks for reals, the canonical range that they come from
//   operator()(four)   the results
// Functors that work on pairs have pair_results and pair(u0, u1, out) besides.
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

/// Whether a functor works on pairs.
template <typename Functor, typename = void>
inline constexpr bool has_pair = false;
template <typename Functor>
inline constexpr bool has_pair<Functor, std::void_t<decltype(Functor::pair_results)>> = true;

}  // namespace kestrel::tarn::rng::detail::gpu
