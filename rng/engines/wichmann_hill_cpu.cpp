// SPDX-License-Identifier: Apache-2.0
// Constructors of wichmann_hill; the one without an index is member 0.
#include <initializer_list>
#include <utility>

#include "frame/engine_seeding.hpp"

namespace kestrel::tarn::rng {

namespace {
constexpr std::uint32_t members = 273;
}

wichmann_hill::wichmann_hill(sycl::queue queue_, std::uint32_t seed, std::uint32_t engine_idx)
    : engine_base(std::move(queue_)) {
  impl = detail::impl_of_member<wichmann_hill>(queue, members, engine_idx, seed);
}

wichmann_hill::wichmann_hill(sycl::queue queue_, std::initializer_list<std::uint32_t> seed,
                             std::uint32_t engine_idx)
    : engine_base(std::move(queue_)) {
  impl = detail::impl_of_member<wichmann_hill>(queue, members, engine_idx, detail::count_of(seed),
                                               seed.begin());
}

wichmann_hill::wichmann_hill(sycl::queue queue_, std::uint32_t seed)
    : wichmann_hill(std::move(queue_), seed, 0) {}

wichmann_hill::wichmann_hill(sycl::queue queue_, std::initializer_list<std::uint32_t> seed)
    : wichmann_hill(std::move(queue_), seed, 0) {}

}  // namespace kestrel::tarn::rng
