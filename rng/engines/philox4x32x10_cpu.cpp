// SPDX-License-Identifier: Apache-2.0
// Constructors of philox4x32x10.
#include <initializer_list>
#include <utility>
#include <vector>

#include "frame/engine_seeding.hpp"

namespace kestrel::tarn::rng {

philox4x32x10::philox4x32x10(sycl::queue queue_, std::uint64_t seed)
    : engine_base(std::move(queue_)) {
  impl = detail::impl_from<philox4x32x10>(queue, seed);
}

// A list of n items travels as n words on a CPU queue, which are the first n of its 2n words, and
// as all 2n words on a GPU queue. Streams made so have to stay as they are.
philox4x32x10::philox4x32x10(sycl::queue queue_, std::initializer_list<std::uint64_t> seed)
    : engine_base(std::move(queue_)) {
  const std::vector<std::uint32_t> words = detail::words_of(seed);
  const std::int64_t items = detail::count_of(seed);
  const std::int64_t n = queue.get_device().is_cpu() ? items : 2 * items;
  impl = detail::impl_from<philox4x32x10>(queue, n, words.data());
}

}  // namespace kestrel::tarn::rng
