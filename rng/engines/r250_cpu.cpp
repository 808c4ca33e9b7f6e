// SPDX-License-Identifier: Apache-2.0
// Constructors of r250.
#include <utility>
#include <vector>

#include "frame/engine_seeding.hpp"

namespace kestrel::tarn::rng {

r250::r250(sycl::queue queue_, std::uint32_t seed) : engine_base(std::move(queue_)) {
  impl = detail::impl_from<r250>(queue, seed);
}

r250::r250(sycl::queue queue_, std::vector<std::uint32_t> seed) : engine_base(std::move(queue_)) {
  impl = detail::impl_from<r250>(queue, detail::count_of(seed), seed.data());
}

}  // namespace kestrel::tarn::rng
