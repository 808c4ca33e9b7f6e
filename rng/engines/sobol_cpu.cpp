// SPDX-License-Identifier: Apache-2.0
// Constructors of sobol.
#include <utility>
#include <vector>

#include "frame/engine_seeding.hpp"

namespace kestrel::tarn::rng {

sobol::sobol(sycl::queue queue_, std::uint32_t dimensions) : engine_base(std::move(queue_)) {
  impl = detail::impl_from<sobol>(queue, dimensions);
}

// 32 direction words for each dimension.
sobol::sobol(sycl::queue queue_, std::vector<std::uint32_t>& direction_numbers)
    : engine_base(std::move(queue_)) {
  const auto dimensions = static_cast<std::uint32_t>(direction_numbers.size() / 32);
  impl = detail::impl_from_table<sobol>(queue, direction_numbers, {dimensions & 0x7FFFFFF, 1, 4});
}

}  // namespace kestrel::tarn::rng
