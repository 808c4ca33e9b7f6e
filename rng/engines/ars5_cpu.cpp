// SPDX-License-Identifier: Apache-2.0
// Constructors of ars5.
#include <initializer_list>
#include <utility>

#include "frame/engine_seeding.hpp"

namespace kestrel::tarn::rng {

ars5::ars5(sycl::queue queue_, std::uint64_t seed) : engine_base(std::move(queue_)) {
  impl = detail::impl_from<ars5>(queue, seed);
}

// As with philox4x32x10 on a CPU queue, a list of n items gives the first n of its 2n words.
ars5::ars5(sycl::queue queue_, std::initializer_list<std::uint64_t> seed)
    : engine_base(std::move(queue_)) {
  impl = detail::impl_from<ars5>(queue, detail::count_of(seed), detail::words_of(seed).data());
}

}  // namespace kestrel::tarn::rng
