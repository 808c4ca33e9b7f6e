// SPDX-License-Identifier: Apache-2.0
// Constructor of mcg31m1.
#include <utility>

#include "frame/engine_seeding.hpp"

namespace kestrel::tarn::rng {

mcg31m1::mcg31m1(sycl::queue queue_, std::uint32_t seed) : engine_base(std::move(queue_)) {
  impl = detail::impl_from<mcg31m1>(queue, seed);
}

}  // namespace kestrel::tarn::rng
