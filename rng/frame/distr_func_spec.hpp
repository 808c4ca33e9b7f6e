// SPDX-License-Identifier: Apache-2.0
// The kernel of distributions on pairs over words that an earlier step has generated, for engines
// that fill device memory with raw words: each work-item makes the results of one pair.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/engine_traits.hpp"
#include "frame/engine_func.hpp"
#include "frame/kernel_launch.hpp"

namespace kestrel::tarn::rng::detail {

/// T is the result type, R the real type of the functor, Out a pointer or a write accessor, Words a
/// pointer or a read accessor to 32-bit words: two for each work-item, also for the last one.
template <typename T, typename R, typename Functor, typename Out,
          typename Words = const std::uint32_t*>
struct distr_func_spec {
  Words words;
  Out r;
  Functor functor;
  word_rule<R> rule;  // scale and offset
  std::uint64_t n;

  SYCL_EXTERNAL void operator()(sycl::id<1> item) const {
    const std::uint64_t g = item[0];
    T results[Functor::pair_results];
    functor.pair(unsigned_word(words[2 * g], rule), unsigned_word(words[2 * g + 1], rule), results);
    sycl::vec<T, Functor::pair_results> values;
    for (int j = 0; j < Functor::pair_results; ++j) {
      values[j] = results[j];
    }
    store_values(r, g * Functor::pair_results, n, values);
  }
};

/// Launches the kernel for `n` results into `r`, a pointer or a buffer, in a command group that
/// runs after the words are there.
template <typename T, typename Functor, typename Words, typename Out>
void launch_distr_func_spec(sycl::handler& group, const Words& words, std::int64_t n, Out& r,
                            const Functor& functor) {
  using R = typename Functor::source;
  auto out = bind_output(group, r);
  const distr_func_spec<T, R, Functor, decltype(out), Words> kernel{
      words, out, functor, unsigned_rule(functor.range()), static_cast<std::uint64_t>(n)};
  group.parallel_for(sycl::range<1>(work_items(n, Functor::pair_results)), kernel);
}

}  // namespace kestrel::tarn::rng::detail
