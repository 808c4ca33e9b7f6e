// SPDX-License-Identifier: Apache-2.0
// Constructor of nondeterministic.
#include <utility>

#include "frame/engine_seeding.hpp"

namespace kestrel::tarn::rng {

nondeterministic::nondeterministic(sycl::queue queue_) : engine_base(std::move(queue_)) {
  constexpr std::uint64_t no_seed = 0;
  impl = detail::impl_from<nondeterministic>(queue, no_seed);
}

}  // namespace kestrel::tarn::rng
