// SPDX-License-Identifier: Apache-2.0
// Constructor of mcg59.
#include <utility>

#include "frame/engine_seeding.hpp"

namespace kestrel::tarn::rng {

mcg59::mcg59(sycl::queue queue_, std::uint64_t seed) : engine_base(std::move(queue_)) {
  impl = detail::impl_from<mcg59>(queue, seed);
}

}  // namespace kestrel::tarn::rng
