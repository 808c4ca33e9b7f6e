// SPDX-License-Identifier: Apache-2.0
// The kernels of mrg32k3a. A jump costs some ten matrix products, so in the default mode a
// work-item makes a long run of the serial sequence after one jump. In the sub-sequence modes
// work-item i goes on in sub-sequence i, with no jump at all, and the results of a call are dealt
// out to the sub-sequences in turn.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/mrg32k3a.hpp"
#include "frame/engine_func.hpp"

namespace kestrel::tarn::rng::detail {

/// Values that one work-item makes in a call for `n`. Fewer, longer runs once there is work enough
/// for every processor.
SYCL_EXTERNAL inline std::uint32_t mrg32k3a_per_item(std::uint64_t n) {
  return n < 32000000 ? 64 : 512;
}

/// Work-items of such a call: whole groups, of which the last may be needed in part.
inline std::uint64_t mrg32k3a_work_items(std::uint64_t n, std::uint64_t group_size) {
  const std::uint64_t per_group = group_size * mrg32k3a_per_item(n);
  return (n + per_group - 1) / per_group * group_size;
}

/// The default mode, over an nd_range whose group size has no influence. Work-items past the end
/// store nothing.
template <typename T, typename R, typename Functor, typename Out>
struct engine_func<mrg32k3a, T, R, Functor, Out> {
  std::int32_t vec_size;
  Out r;
  Functor functor;
  tag_rvx_sycl_brng_mrg32k3a_stream_t state;
  word_rule<R> rule;
  std::uint64_t n;

  SYCL_EXTERNAL void operator()(sycl::nd_item<1> item) const {
    const std::uint64_t first = item.get_global_linear_id() * mrg32k3a_per_item(n);
    const std::uint64_t end = first + mrg32k3a_per_item(n);
    tag_rvx_sycl_brng_mrg32k3a_stream_t position = state;
    mrg32k3a_skip(&position, static_cast<std::int64_t>(first * gpu::words_per_result<Functor>));
    for (std::uint64_t base = first; base < end; base += static_cast<std::uint64_t>(vec_size)) {
      sycl::vec<R, 4> words;
      for (int i = 0; i < 4; ++i) {
        words[i] = unsigned_word(mrg32k3a_step(&position), rule);
      }
      store_values<T, Functor::results>(r, base, n, results_of<T>(functor, words, base));
    }
  }
};

/// Of the results of a call the number of the first that sub-sequence `i` of `streams` gives, when
/// the call begins at `position`; the others follow at a distance of `streams`.
SYCL_EXTERNAL inline std::uint64_t mrg32k3a_first_result(std::uint32_t i, std::uint32_t position,
                                                         std::uint32_t streams) {
  return i >= position ? i - position : std::uint64_t{i} + streams - position;
}

/// How many of `n` results those are. In closed form: counting whole rounds and a head of
/// min(n, streams) - position results loses that head when n equals a position past the middle.
SYCL_EXTERNAL inline std::uint64_t mrg32k3a_results_from(std::uint64_t first, std::uint64_t n,
                                                         std::uint32_t streams) {
  return first < n ? (n - first - 1) / streams + 1 : 0;
}

/// The sub-sequence modes. A result takes one word of its sub-sequence, or two; where a functor
/// makes more results than are left, or reads a word ahead to make a pair, the record nevertheless
/// stands behind the words of the results stored.
template <typename T, typename R, typename Functor, typename Out>
struct engine_func_sub_seq<mrg32k3a, T, R, Functor, Out> {
  Out r;
  Functor functor;
  tag_rvx_sycl_brng_mrg32k3a_stream_t* streams;
  std::uint64_t n;
  std::uint32_t streams_number;
  std::uint32_t position;
  word_rule<R> rule;

  SYCL_EXTERNAL void operator()(sycl::id<1> item) const {
    constexpr std::uint64_t results = Functor::results;
    constexpr std::uint64_t words_per_result = 4 / results;
    const auto i = static_cast<std::uint32_t>(item[0]);
    std::uint64_t index = mrg32k3a_first_result(i, position, streams_number);
    std::uint64_t left = mrg32k3a_results_from(index, n, streams_number);
    if (left == 0) {
      return;
    }
    tag_rvx_sycl_brng_mrg32k3a_stream_t state = streams[i];
    tag_rvx_sycl_brng_mrg32k3a_stream_t end = state;
    while (left != 0) {
      const std::uint64_t stored = left < results ? left : results;
      sycl::vec<R, 4> words;
      for (int k = 0; k < 4; ++k) {
        words[k] = unsigned_word(mrg32k3a_step(&state), rule);
        if (static_cast<std::uint64_t>(k) + 1 == stored * words_per_result) {
          end = state;
        }
      }
      const sycl::vec<T, Functor::results> values = functor(words);
      for (std::uint64_t k = 0; k < stored; ++k, index += streams_number) {
        r[index] = values[static_cast<int>(k)];
      }
      left -= stored;
    }
    streams[i] = end;
  }
};

}  // namespace kestrel::tarn::rng::detail
