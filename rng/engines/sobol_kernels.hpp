// SPDX-License-Identifier: Apache-2.0
// The kernels of sobol. A work-group has a dimension: it keeps the direction words in local memory,
// and each work-item jumps once and then steps through points that follow one another. Results come
// point by point, so those of a work-item stand `dimensions` apart.
#pragma once

#include <cstddef>
#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/sobol.hpp"
#include "frame/engine_func.hpp"

namespace kestrel::tarn::rng::detail {

/// A call as the kernel sees it: where the engine stands, and who makes what.
struct sobol_walk {
  const std::uint32_t* directions;  // 32 for each dimension
  const std::uint32_t* point;       // the current one
  std::uint32_t dimensions;
  std::uint32_t index;  // of the current point, modulo 2^32
  std::uint32_t taken;  // coordinates of it that earlier calls had: 0 to dimensions - 1
  std::uint64_t n;      // words to store

  /// Points that each item of a group of `group_size` makes: a multiple of four, as functors turn
  /// four words at once. All points of the call are counted, that in progress among them: counted
  /// behind it, the last one would lack its item where the others fill all items.
  SYCL_EXTERNAL std::uint64_t points_per_item(std::uint64_t group_size) const {
    const std::uint64_t points = (taken + n + dimensions - 1) / dimensions;
    const std::uint64_t share = (points + group_size - 1) / group_size;
    return (share + 3) / 4 * 4;
  }
};

/// Over an nd_range of as many groups as there are dimensions; the group size has no influence on
/// results. The functor turns each of its four values alone: pairs go through distr_func_spec.
template <typename T, typename R, typename Functor, typename Out>
struct engine_func<sobol, T, R, Functor, Out> {
  static_assert(Functor::results == 4);

  Out r;
  Functor functor;
  sobol_walk walk;
  word_rule<R> rule;
  sycl::local_accessor<std::uint32_t, 1> directions;  // 32 words

  SYCL_EXTERNAL void operator()(sycl::nd_item<1> item) const {
    const std::uint64_t dimension = item.get_group(0);
    const std::uint64_t group_size = item.get_local_range(0);
    for (std::uint64_t k = item.get_local_id(0); k < sobol_directions; k += group_size) {
      directions[k] = walk.directions[dimension * sobol_directions + k];
    }
    sycl::group_barrier(item.get_group());

    const std::uint64_t points = walk.points_per_item(group_size);
    const std::uint64_t first = item.get_local_id(0) * points;
    // Below 0 where an earlier call had the coordinate. Words of a call are far below 2^63.
    std::int64_t place = static_cast<std::int64_t>(first * walk.dimensions + dimension) -
                         static_cast<std::int64_t>(walk.taken);
    const std::int64_t end = static_cast<std::int64_t>(walk.n);
    if (place >= end) {
      return;
    }
    std::uint32_t index = walk.index + static_cast<std::uint32_t>(first);
    std::uint32_t word = walk.point[dimension] ^ sobol_jump(directions, walk.index, index);
    for (std::uint64_t point = 0; point < points && place < end; point += 4) {
      sycl::vec<R, 4> words;
      for (int i = 0; i < 4; ++i) {
        words[i] = unsigned_word(word, rule);
        word ^= directions[sobol_step(index)];
        ++index;
      }
      const sycl::vec<T, 4> values =
          results_of<T>(functor, words, static_cast<std::uint64_t>(place), walk.dimensions);
      store_points(place, values);
      place += 4 * std::int64_t{walk.dimensions};
    }
  }

 private:
  /// Stores the results of four points that follow one another, the first at `place`; those of
  /// other calls are dropped.
  SYCL_EXTERNAL void store_points(std::int64_t place, const sycl::vec<T, 4>& values) const {
    if (walk.dimensions == 1) {  // neighbours, and no point is ever in progress
      store_values(r, static_cast<std::uint64_t>(place), walk.n, values);
      return;
    }
    const std::int64_t end = static_cast<std::int64_t>(walk.n);
    for (int i = 0; i < 4; ++i, place += walk.dimensions) {
      if (place >= 0 && place < end) {
        r[static_cast<std::size_t>(place)] = values[i];
      }
    }
  }
};

/// Moves the current point, one work-item for each dimension.
struct sobol_skip_func {
  const std::uint32_t* directions;
  std::uint32_t* point;
  std::uint32_t from;  // indices modulo 2^32
  std::uint32_t to;

  SYCL_EXTERNAL void operator()(sycl::id<1> item) const {
    const std::size_t dimension = item[0];
    point[dimension] ^= sobol_jump(directions + dimension * sobol_directions, from, to);
  }
};

}  // namespace kestrel::tarn::rng::detail
