// SPDX-License-Identifier: Apache-2.0
// Constructors of mt2203. On a CPU queue the engine without an index is member 0.
#include <initializer_list>
#include <utility>

#include "frame/engine_seeding.hpp"

namespace kestrel::tarn::rng {

namespace {
constexpr std::uint32_t members = 6024;
}

mt2203::mt2203(sycl::queue queue_, std::uint32_t seed) : engine_base(std::move(queue_)) {
  impl = detail::impl_from<mt2203>(queue, seed);
}

mt2203::mt2203(sycl::queue queue_, std::uint32_t seed, std::uint32_t engine_idx)
    : engine_base(std::move(queue_)) {
  impl = detail::impl_of_member<mt2203>(queue, members, engine_idx, seed);
}

mt2203::mt2203(sycl::queue queue_, std::initializer_list<std::uint32_t> seed)
    : engine_base(std::move(queue_)) {
  impl = detail::impl_from<mt2203>(queue, detail::count_of(seed), seed.begin());
}

mt2203::mt2203(sycl::queue queue_, std::initializer_list<std::uint32_t> seed,
               std::uint32_t engine_idx)
    : engine_base(std::move(queue_)) {
  impl = detail::impl_of_member<mt2203>(queue, members, engine_idx, detail::count_of(seed),
                                        seed.begin());
}

}  // namespace kestrel::tarn::rng
