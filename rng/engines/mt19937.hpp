// SPDX-License-Identifier: Apache-2.0
// mt19937 in kernels: the Mersenne twister of Matsumoto and Nishimura, ACM TOMACS 8, 1998, in the
// serial order of one sequence. All work-groups start from the same state and pass over the words
// of the groups before them; two halves of the state's memory let the last group store the new
// state while the others still read the old one.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/twister_kernels.hpp"

namespace kestrel::tarn::rng::detail {

/// Groups of 224 work-items, on a ring of 848 words.
using mt19937_shape = twister_shape<624, 397, 224, 31, 11>;
inline constexpr std::uint32_t mt19937_group_count = 32;
inline constexpr twister_constants mt19937_constants{0x9908B0DF, 0x9D2C5680, 0xEFC60000};

struct mt19937_groups {
  std::uint32_t* state;  // two images
  std::uint8_t active;   // 1: the first one is read and the second one written; 0: the reverse

  SYCL_EXTERNAL const std::uint32_t* source(std::uint32_t) const { return half(active != 0); }
  SYCL_EXTERNAL std::uint32_t* target(std::uint32_t group, std::uint32_t count) const {
    return group + 1 == count ? half(active == 0) : nullptr;
  }
  SYCL_EXTERNAL static twister_constants constants(std::uint32_t) { return mt19937_constants; }

  /// The first groups make the rounds that are left.
  SYCL_EXTERNAL static twister_share share(std::uint32_t group, std::uint32_t,
                                           const twister_plan& plan) {
    const bool one_more = group < plan.more;
    const std::uint64_t first = group * plan.rounds + (one_more ? group : plan.more);
    return {first, first, plan.rounds + (one_more ? 1 : 0)};
  }
  SYCL_EXTERNAL static bool moves(std::uint32_t, std::uint32_t, const twister_plan&) {
    return true;
  }

 private:
  SYCL_EXTERNAL std::uint32_t* half(bool first) const {
    return first ? state : state + mt19937_shape::image;
  }
};

/// Moves an image by 224 * rounds + tail words, tail below 224; one work-group.
struct mt19937_skip {
  sycl::local_accessor<std::uint32_t, 1> image;
  std::uint32_t* state;
  std::uint64_t rounds;
  std::uint32_t tail;

  SYCL_EXTERNAL void operator()(sycl::nd_item<1> item) const {
    twister_walker<mt19937_shape> walker(item, &image[0], mt19937_constants.matrix);
    walker.load(state);
    walker.replay(rounds);
    if (walker.number() < tail) {
      walker.retire();
    }
    walker.move_position(tail);
    walker.store(state);
  }
};

template <>
struct engine_traits<mt19937> {
  using record = twister_record<mt19937_shape>;
  using shape = mt19937_shape;
  using groups = mt19937_groups;

  template <typename Real>
  static word_rule<Real> rule(gpu::real_range<Real> range) {
    return unsigned_rule(range);
  }
};
static_assert(sizeof(engine_traits<mt19937>::record) == 2500);

}  // namespace kestrel::tarn::rng::detail
