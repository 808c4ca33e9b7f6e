// SPDX-License-Identifier: Apache-2.0
// The kernel of distributions on pairs, or on four values, over words that an earlier step has
// generated, for engines that fill device memory with raw words: each work-item makes the results
// of one pair.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/engine_traits.hpp"
#include "frame/engine_func.hpp"
#include "frame/kernel_launch.hpp"

namespace kestrel::tarn::rng::detail {

/// T is the result type, R the real type of the functor, Out a pointer or a write accessor, Words a
/// pointer or a read accessor to 32-bit words: two (four) for each work-item, also for the last
/// one.
template <typename T, typename R, typename Functor, typename Out,
          typename Words = const std::uint32_t*>
struct distr_func_spec {
  Words words;
  Out r;
  Functor functor;
  word_rule<R> rule;  // scale and offset
  std::uint64_t n;

  SYCL_EXTERNAL void operator()(sycl::id<1> item) const {
    constexpr int together = gpu::values_together<Functor>;
    constexpr int made = gpu::results_together<Functor>;
    const std::uint64_t g = item[0];
    R values[together];
    for (int i = 0; i < together; ++i) {
      values[i] = unsigned_word(words[g * together + static_cast<std::uint64_t>(i)], rule);
    }
    store_values(r, g * made, n, results_of_some<T>(functor, values, g * made));
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
  group.parallel_for(sycl::range<1>(work_items(n, gpu::results_together<Functor>)), kernel);
}

}  // namespace kestrel::tarn::rng::detail
