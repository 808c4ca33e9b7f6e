// SPDX-License-Identifier: Apache-2.0
// Constructors of sfmt19937.
#include <initializer_list>
#include <utility>

#include "frame/engine_seeding.hpp"

namespace kestrel::tarn::rng {

sfmt19937::sfmt19937(sycl::queue queue_, std::uint32_t seed) : engine_base(std::move(queue_)) {
  impl = detail::impl_from<sfmt19937>(queue, seed);
}

sfmt19937::sfmt19937(sycl::queue queue_, std::initializer_list<std::uint32_t> seed)
    : engine_base(std::move(queue_)) {
  impl = detail::impl_from<sfmt19937>(queue, detail::count_of(seed), seed.begin());
}

}  // namespace kestrel::tarn::rng
