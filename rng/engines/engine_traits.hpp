// SPDX-License-Identifier: Apache-2.0
// What a kernel needs to know of an engine. Each stepping header specialises engine_traits:
//   record          plain words of the engine, as they stand in the host stream's memory
//   rule(range)     two numbers from which the kernel makes reals out of words: scale and offset,
//                   computed on the host in the precision of the result, or the range itself where
//                   the kernel computes them
//   four<asks>(record*, block, out, rule)
//                   the four values of work-block `block`, counted from the record's position; may
//                   overwrite the record. Engines without a cheap jump have a kernel of their own
#pragma once

#include <cstdint>

#include <kestrel/tarn/rng/engines.hpp>
#include <sycl/sycl.hpp>

#include "distributions/kernel_functor.hpp"

namespace kestrel::tarn::rng::detail {

template <typename Engine>
struct engine_traits;

/// The word-to-real rule of a call; what the numbers mean is the engine's affair. For words, which
/// need no rule, R is std::uint32_t and both are 0.
template <typename R>
struct word_rule {
  R a;
  R b;
};

/// A word as a result where it is read as an unsigned number: itself, or times `a` plus `b`.
SYCL_EXTERNAL inline std::uint32_t unsigned_word(std::uint32_t word, word_rule<std::uint32_t>) {
  return word;
}
template <typename Real>
SYCL_EXTERNAL Real unsigned_word(std::uint32_t word, word_rule<Real> rule) {
  return sycl::mad(static_cast<Real>(word), rule.a, rule.b);
}

/// The rule of unsigned 32-bit words: scale and offset.
template <typename Real>
word_rule<Real> unsigned_rule(gpu::real_range<Real> range) {
  return {(range.hi - range.lo) * static_cast<Real>(0x1p-32), range.lo};
}

/// The rule that a functor's reals ask of the engine.
template <typename Engine, typename Functor>
word_rule<typename Functor::source> rule_of(const Functor& functor) {
  if constexpr (Functor::asks == gpu::drawn::reals) {
    return engine_traits<Engine>::rule(functor.range());
  } else {
    return {0, 0};
  }
}

}  // namespace kestrel::tarn::rng::detail
