// SPDX-License-Identifier: Apache-2.0
// mt2203 in kernels: members of a family of Mersenne twisters (Matsumoto and Nishimura, "Dynamic
// creation of pseudorandom number generators", MCQMC 1998, Springer 2000), one for each work-group.
// A call is cut into as many runs as there are generators, one run from each.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/twister_kernels.hpp"

namespace kestrel::tarn::rng::detail {

/// Groups of 32 work-items, on a ring of 101 words.
using mt2203_shape = twister_shape<69, 34, 32, 5, 12>;

struct mt2203_groups {
  std::uint32_t* states;  // an image for each generator
  const std::uint32_t* matrix_a;
  const std::uint32_t* mask_b;
  const std::uint32_t* mask_c;

  SYCL_EXTERNAL const std::uint32_t* source(std::uint32_t group) const {
    return states + std::uint64_t{group} * mt2203_shape::image;
  }
  SYCL_EXTERNAL std::uint32_t* target(std::uint32_t group, std::uint32_t) const {
    return states + std::uint64_t{group} * mt2203_shape::image;
  }
  SYCL_EXTERNAL twister_constants constants(std::uint32_t group) const {
    return {matrix_a[group], mask_b[group], mask_c[group]};
  }

  /// The last generator takes all that is left.
  SYCL_EXTERNAL static twister_share share(std::uint32_t group, std::uint32_t count,
                                           const twister_plan& plan) {
    return {0, group * plan.rounds, plan.rounds + (group + 1 == count ? plan.more : 0)};
  }

  /// In a call with a tail the generators other than the last keep their old position, although
  /// their words have moved on: the next call reads from there. Results depend on it.
  SYCL_EXTERNAL static bool moves(std::uint32_t group, std::uint32_t count,
                                  const twister_plan& plan) {
    return plan.tail == 0 || group + 1 == count;
  }
};

/// The state record as it stands in the host stream's memory.
struct mt2203_record {
  twister_record<mt2203_shape> block;
  twister_constants constants;
};
static_assert(sizeof(mt2203_record) == 292);

template <>
struct engine_traits<mt2203> {
  using record = mt2203_record;
  using shape = mt2203_shape;
  using groups = mt2203_groups;

  template <typename Real>
  static word_rule<Real> rule(gpu::real_range<Real> range) {
    return unsigned_rule(range);
  }
};

}  // namespace kestrel::tarn::rng::detail
