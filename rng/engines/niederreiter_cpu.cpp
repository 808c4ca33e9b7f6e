// SPDX-License-Identifier: Apache-2.0
// Constructors of niederreiter.
#include <utility>
#include <vector>

#include "frame/engine_seeding.hpp"

namespace kestrel::tarn::rng {

niederreiter::niederreiter(sycl::queue queue_, std::uint32_t dimensions)
    : engine_base(std::move(queue_)) {
  impl = detail::impl_from<niederreiter>(queue, dimensions);
}

niederreiter::niederreiter(sycl::queue queue_, std::vector<std::uint32_t>& irreducible_polynomials)
    : engine_base(std::move(queue_)) {
  const auto count = static_cast<std::uint32_t>(irreducible_polynomials.size());
  impl = detail::impl_from_table<niederreiter>(queue, irreducible_polynomials, {count, 1, 1});
}

}  // namespace kestrel::tarn::rng
